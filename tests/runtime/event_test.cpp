// SPDX-License-Identifier: Apache-2.0
#include <fcntl.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "runtime/handle.h"
#include "tests/runtime/thread_routines.h"
#include "tests/support/failing_new.h"
#include "tests/support/process_state.h"

namespace vexa_test {
namespace {

vexa::EventHandle& record(const Event& event) { return *vexa::record_of<vexa::EventHandle>(event.get()); }

bool is_signalled(const Event& event) { return WaitForSingleObject(event.get(), 0) == 0; }

typedHandle file_handle = {HANDLE_TYPE_FILE};
typedHandle thread_handle = {HANDLE_TYPE_THREAD};

TEST(CreateEvent, RefusesWhatIsNotAPlainManualResetEvent) {
  _SECURITY_ATTRIBUTES attributes = {};
  const std::size_t before = open_descriptors();
  EXPECT_EQ(CreateEvent(&attributes, 1, 0, nullptr), nullptr);
  EXPECT_EQ(CreateEvent(nullptr, 0, 0, nullptr), nullptr);
  EXPECT_EQ(CreateEvent(nullptr, 2, 0, nullptr), nullptr);
  EXPECT_EQ(CreateEvent(nullptr, -1, 0, nullptr), nullptr);
  EXPECT_EQ(CreateEvent(nullptr, 1, 0, "name"), nullptr);
  EXPECT_EQ(CreateEvent(nullptr, 1, 0, ""), nullptr);
  EXPECT_EQ(open_descriptors(), before);
}

TEST(CreateEvent, IgnoresTheInitialState) {
  for (const int initial_state : {0, 1, -1}) {
    const Event event(CreateEvent(nullptr, 1, initial_state, nullptr));
    ASSERT_NE(event, nullptr);
    EXPECT_EQ(WaitForSingleObject(event.get(), 0), WAIT_TIMEOUT) << initial_state;
  }
}

TEST(CreateEvent, MakesAReadEndThatDoesNotBlock) {
  const Event event = make_event();
  int fd = -1;
  ASSERT_TRUE(eventFd(event.get(), fd));
  EXPECT_NE(fcntl(fd, F_GETFL) & O_NONBLOCK, 0);
}

TEST(CreateEvent, GivesNullWithoutDescriptors) {
  const std::size_t before = open_descriptors();
  rlimit limit = {};
  ASSERT_EQ(getrlimit(RLIMIT_NOFILE, &limit), 0);
  const int next = dup(0);
  close(next);
  rlimit one_left = limit;
  one_left.rlim_cur = static_cast<rlim_t>(next) + 1;
  ASSERT_EQ(setrlimit(RLIMIT_NOFILE, &one_left), 0);
  typedHandle* event = CreateEvent(nullptr, 1, 0, nullptr);
  ASSERT_EQ(setrlimit(RLIMIT_NOFILE, &limit), 0);
  EXPECT_EQ(event, nullptr);
  EXPECT_EQ(open_descriptors(), before);
}

TEST(CreateEvent, GivesNullWithoutMemory) {
  const std::size_t before = open_descriptors();
  const AllocationFailure failure(0);
  EXPECT_EQ(CreateEvent(nullptr, 1, 0, nullptr), nullptr);
  EXPECT_TRUE(failure.happened());
  EXPECT_EQ(open_descriptors(), before);
}

bool child_sees(int fd) {
  const std::string path = "/proc/self/fd/" + std::to_string(fd);
  char program[] = "/usr/bin/test";
  char option[] = "-e";
  std::string argument = path;
  char* const arguments[] = {program, option, argument.data(), nullptr};
  char* const environment[] = {nullptr};
  pid_t child = -1;
  EXPECT_EQ(posix_spawn(&child, program, nullptr, nullptr, arguments, environment), 0);
  int status = -1;
  EXPECT_EQ(waitpid(child, &status, 0), child);
  EXPECT_TRUE(WIFEXITED(status));
  return WEXITSTATUS(status) == 0;
}

TEST(CreateEvent, ChildProcessInheritsNoDescriptor) {
  const Event event = make_event();
  const int inherited = dup(0);
  EXPECT_TRUE(child_sees(inherited));
  close(inherited);
  EXPECT_FALSE(child_sees(record(event).read_fd));
  EXPECT_FALSE(child_sees(record(event).write_fd));
}

TEST(EventFd, BecomesReadableWithTheSignal) {
  const Event event = make_event();
  int fd = -1;
  ASSERT_TRUE(eventFd(event.get(), fd));
  pollfd readable = {fd, POLLIN, 0};
  EXPECT_EQ(poll(&readable, 1, 0), 0);
  EXPECT_EQ(SetEvent(event.get()), 1);
  EXPECT_EQ(poll(&readable, 1, 0), 1);
  EXPECT_EQ(ResetEvent(event.get()), 1);
  EXPECT_EQ(poll(&readable, 1, 0), 0);
}

TEST(EventFd, LeavesTheNumberForOtherHandles) {
  for (typedHandle* handle : {static_cast<typedHandle*>(nullptr), &file_handle, &thread_handle}) {
    int fd = 77;
    EXPECT_FALSE(eventFd(handle, fd));
    EXPECT_EQ(fd, 77);
  }
}

TEST(Event, OperationsRefuseNullAndOtherKinds) {
  for (typedHandle* handle : {static_cast<typedHandle*>(nullptr), &file_handle, &thread_handle}) {
    EXPECT_EQ(SetEvent(handle), 0);
    EXPECT_EQ(ResetEvent(handle), 0);
    EXPECT_EQ(CloseEventHandle(handle), 0);
  }
}

TEST(Event, StaysSignalledThroughWaitsUntilReset) {
  const Event event = make_event();
  EXPECT_EQ(SetEvent(event.get()), 1);
  EXPECT_EQ(WaitForSingleObject(event.get(), 0), 0U);
  EXPECT_EQ(WaitForSingleObject(event.get(), 0), 0U);
  EXPECT_EQ(ResetEvent(event.get()), 1);
  EXPECT_EQ(WaitForSingleObject(event.get(), 0), 0xFFFFFFFEU);
}

TEST(Event, OneResetEndsASignalSetThreeTimes) {
  const Event event = make_event();
  for (int i = 0; i < 3; ++i) EXPECT_EQ(SetEvent(event.get()), 1);
  EXPECT_EQ(ResetEvent(event.get()), 1);
  EXPECT_FALSE(is_signalled(event));
}

TEST(Event, ResetOfAnEventThatIsNotSetSucceeds) {
  const Event event = make_event();
  EXPECT_EQ(ResetEvent(event.get()), 1);
  EXPECT_FALSE(is_signalled(event));
  EXPECT_EQ(SetEvent(event.get()), 1);
  EXPECT_TRUE(is_signalled(event));
}

TEST(SetEvent, PutsOneZeroByteIntoThePipe) {
  const Event event = make_event();
  EXPECT_EQ(SetEvent(event.get()), 1);
  EXPECT_EQ(SetEvent(event.get()), 1);
  char bytes[4] = {'x', 'x', 'x', 'x'};
  ASSERT_EQ(read(record(event).read_fd, bytes, sizeof bytes), 2);
  EXPECT_EQ(std::string(bytes, 4), std::string("\0\0xx", 4));
}

TEST(SetEvent, AMillionTimesWithoutAResetNeverBlocks) {
  const Event event = make_event();
  int refused = 0;
  for (int i = 0; i < 1000000; ++i) refused += SetEvent(event.get()) == 1 ? 0 : 1;
  EXPECT_EQ(refused, 0);
  EXPECT_TRUE(is_signalled(event));
  EXPECT_EQ(ResetEvent(event.get()), 1);
  EXPECT_FALSE(is_signalled(event));
}

TEST(SetEvent, FromManyThreadsOnAFullPipeNeverBlocks) {
  const Event event = make_event();
  std::atomic<int> refused{0};
  std::vector<std::thread> setters;
  setters.reserve(8);
  for (int t = 0; t < 8; ++t) {
    setters.emplace_back([&] {
      for (int i = 0; i < 20000; ++i) refused += SetEvent(event.get()) == 1 ? 0 : 1;
    });
  }
  for (std::thread& setter : setters) setter.join();
  EXPECT_EQ(refused, 0);
  EXPECT_TRUE(is_signalled(event));
}

TEST(SetEvent, FailsWithoutSigpipeWhenTheReadEndIsGone) {
  Event event = make_event();
  close(record(event).read_fd);
  EXPECT_EQ(SetEvent(event.get()), 0);
  EXPECT_EQ(CloseEventHandle(event.release()), 0);
}

TEST(SetEvent, FailsWhenTheWriteEndIsGone) {
  Event event = make_event();
  close(record(event).write_fd);
  EXPECT_EQ(SetEvent(event.get()), 0);
  EXPECT_EQ(CloseEventHandle(event.release()), 0);
}

TEST(ResetEvent, FailsWhenTheReadEndIsGone) {
  Event event = make_event();
  close(record(event).read_fd);
  EXPECT_EQ(ResetEvent(event.get()), 0);
  EXPECT_EQ(CloseEventHandle(event.release()), 0);
}

TEST(ResetEvent, TakesTheEndOfThePipeForDrained) {
  Event event = make_event();
  EXPECT_EQ(SetEvent(event.get()), 1);
  close(record(event).write_fd);
  EXPECT_EQ(ResetEvent(event.get()), 1);
  EXPECT_EQ(CloseEventHandle(event.release()), 0);
}

TEST(ResetEvent, DrainsWhileOthersSet) {
  const Event event = make_event();
  std::atomic<bool> stop{false};
  std::thread setter([&] {
    while (!stop) SetEvent(event.get());
  });
  int refused = 0;
  for (int i = 0; i < 200; ++i) refused += ResetEvent(event.get()) == 1 ? 0 : 1;
  stop = true;
  setter.join();
  EXPECT_EQ(refused, 0);
  EXPECT_EQ(ResetEvent(event.get()), 1);
  EXPECT_FALSE(is_signalled(event));
}

TEST(CloseEventHandle, ClosesBothEnds) {
  Event event = make_event();
  const int ends[] = {record(event).read_fd, record(event).write_fd};
  EXPECT_EQ(CloseEventHandle(event.release()), 1);
  for (const int end : ends) EXPECT_EQ(fcntl(end, F_GETFD), -1);
}

TEST(CloseEventHandle, ClosesTheWriteEndEvenWhenTheReadEndCannotBe) {
  Event event = make_event();
  const int write_fd = record(event).write_fd;
  close(record(event).read_fd);
  EXPECT_EQ(CloseEventHandle(event.release()), 0);
  EXPECT_EQ(fcntl(write_fd, F_GETFD), -1);
}

}  // namespace
}  // namespace vexa_test
