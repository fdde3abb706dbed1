// SPDX-License-Identifier: Apache-2.0
#include "runtime/handle.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <string>
#include <type_traits>

#include "runtime/debug_output.h"
#include "tests/runtime/thread_routines.h"
#include "tests/support/process_state.h"

namespace {

using testing::internal::CaptureStderr;
using testing::internal::GetCapturedStderr;

constexpr char kInvalidFileHandle[] = "checkFileHandle : called with invalid handle\n";

vexa::FileHandle* open_null_device() {
  auto* file = vexa::new_record<vexa::FileHandle>();
  file->fd = open("/dev/null", O_RDWR | O_CLOEXEC);
  return file;
}

TEST(Handle, KindsHaveTheirNumbers) {
  EXPECT_EQ(HANDLE_TYPE_EVENT, 0);
  EXPECT_EQ(HANDLE_TYPE_THREAD, 1);
  EXPECT_EQ(HANDLE_TYPE_FILE, 2);
  EXPECT_EQ(HANDLE_TYPE_FIND, 3);
}

TEST(Handle, KindIsASigned32BitFieldAtTheHeadOfEachRecord) {
  static_assert(std::is_same<decltype(typedHandle::kind), std::int32_t>::value, "kind");
  typedHandle* event = CreateEvent(nullptr, 1, 0, nullptr);
  ASSERT_NE(event, nullptr);
  EXPECT_EQ(static_cast<void*>(event), static_cast<void*>(&event->kind));
  EXPECT_EQ(event->kind, HANDLE_TYPE_EVENT);
  EXPECT_EQ(CloseHandle(event), 1);
}

TEST(Handle, RecordsOfOtherKindsAreNotTaken) {
  vexa::EventHandle event;
  event.kind = HANDLE_TYPE_EVENT;
  EXPECT_EQ(vexa::record_of<vexa::EventHandle>(&event), &event);
  EXPECT_EQ(vexa::record_of<vexa::FileHandle>(&event), nullptr);
  EXPECT_EQ(vexa::record_of<vexa::FindHandle>(&event), nullptr);
  EXPECT_EQ(vexa::record_of<_windowsThreadHandle>(&event), nullptr);
  EXPECT_EQ(vexa::record_of<vexa::EventHandle>(nullptr), nullptr);
}

TEST(CloseHandle, RefusesNull) { EXPECT_EQ(CloseHandle(nullptr), 0); }

TEST(CloseHandle, RefusesSearchesAndUnknownKinds) {
  for (const std::int32_t kind : {HANDLE_TYPE_FIND, 4, -1, 0x7FFFFFFF}) {
    typedHandle handle = {kind};
    CaptureStderr();
    EXPECT_EQ(CloseHandle(&handle), 0) << kind;
    EXPECT_EQ(GetCapturedStderr(), "") << kind;
    EXPECT_EQ(handle.kind, kind);
  }
}

TEST(CloseHandle, ClosesAnEvent) {
  const std::size_t before = vexa_test::open_descriptors();
  typedHandle* event = CreateEvent(nullptr, 1, 0, nullptr);
  ASSERT_NE(event, nullptr);
  EXPECT_EQ(vexa_test::open_descriptors(), before + 2);
  EXPECT_EQ(CloseHandle(event), 1);
  EXPECT_EQ(vexa_test::open_descriptors(), before);
}

TEST(CloseHandle, ClosesAFile) {
  const std::size_t before = vexa_test::open_descriptors();
  vexa::FileHandle* file = open_null_device();
  EXPECT_EQ(vexa_test::open_descriptors(), before + 1);
  EXPECT_EQ(CloseHandle(file), 1);
  EXPECT_EQ(vexa_test::open_descriptors(), before);
}

TEST(CloseHandle, ClosesAThread) {
  std::atomic<long> id{0};
  typedHandle* thread = _beginthreadex(nullptr, 0, vexa_test::store_identifier, &id, 0, nullptr);
  ASSERT_NE(thread, nullptr);
  EXPECT_EQ(CloseHandle(thread), 1);
  EXPECT_TRUE(vexa_test::eventually([&id] { return id != 0 && !vexa_test::is_running(id); }));
}

TEST(CloseFileHandle, RefusesNullWithALine) {
  CaptureStderr();
  EXPECT_EQ(CloseFileHandle(nullptr), 0);
  EXPECT_EQ(GetCapturedStderr(), kInvalidFileHandle);
}

TEST(CloseFileHandle, RefusesAnotherKindWithALineAndLeavesItOpen) {
  typedHandle* event = CreateEvent(nullptr, 1, 0, nullptr);
  ASSERT_NE(event, nullptr);
  CaptureStderr();
  EXPECT_EQ(CloseFileHandle(event), 0);
  EXPECT_EQ(GetCapturedStderr(), kInvalidFileHandle);
  EXPECT_EQ(SetEvent(event), 1);
  EXPECT_EQ(CloseEventHandle(event), 1);
}

TEST(CloseFileHandle, ClosesSilently) {
  vexa::FileHandle* file = open_null_device();
  const int fd = file->fd;
  CaptureStderr();
  EXPECT_EQ(CloseFileHandle(file), 1);
  EXPECT_EQ(GetCapturedStderr(), "");
  EXPECT_EQ(fcntl(fd, F_GETFD), -1);
}

TEST(CloseFileHandle, ReportsWhyClosingFailedAndStillFreesTheRecord) {
  vexa::FileHandle* file = vexa::new_record<vexa::FileHandle>();
  CaptureStderr();
  EXPECT_EQ(CloseFileHandle(file), 0);
  EXPECT_EQ(GetCapturedStderr(), "CloseFileHandle fclose: Bad file descriptor\n");
}

TEST(DebugLine, WritesALineOfAnyLengthWhole) {
  const std::string long_name(10000, 'x');
  CaptureStderr();
  vexa::debug_line("DeleteFile unlink %s: %s", long_name.c_str(), vexa::ErrorText(ENOENT).c_str());
  EXPECT_EQ(GetCapturedStderr(), "DeleteFile unlink " + long_name + ": No such file or directory\n");
}

TEST(DebugLine, LeavesFormatCharactersInArgumentsAlone) {
  CaptureStderr();
  vexa::debug_line("MoveFile rename %s", "%n%s%1000d");
  EXPECT_EQ(GetCapturedStderr(), "MoveFile rename %n%s%1000d\n");
}

TEST(ErrorText, HasATextForAnUnknownCode) { EXPECT_STREQ(vexa::ErrorText(99999).c_str(), "Unknown error 99999"); }

}  // namespace
