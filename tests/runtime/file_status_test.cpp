// SPDX-License-Identifier: Apache-2.0
#include "runtime/file_status.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <string>

#include "tests/support/in_child.h"
#include "tests/support/temporary_folder.h"
#include "vexa/runtime.h"

namespace vexa_test {
namespace {

constexpr std::uint32_t kFailed = 0xFFFFFFFF;
constexpr uid_t kOtherUser = 54321;

struct stat64 status_of(mode_t mode, uid_t user, gid_t group) {
  struct stat64 status {};
  status.st_mode = mode;
  status.st_uid = user;
  status.st_gid = group;
  return status;
}

TEST(FileAttributes, HaveThisLayersNumbers) {
  EXPECT_EQ(FILE_ATTRIBUTE_DIRECTORY, 8U);
  EXPECT_EQ(FILE_ATTRIBUTE_NORMAL, 0x40U);
  EXPECT_EQ(FILE_ATTRIBUTE_READONLY, 0x200U);
  EXPECT_EQ(INVALID_FILE_ATTRIBUTES, kFailed);
}

TEST(FileAttributes, TheWriteBitThatAppliesDecides) {
  const uid_t me = geteuid();
  const gid_t mine = getegid();
  const struct {
    mode_t permissions;
    uid_t user;
    gid_t group;
    bool writable;
  } cases[] = {
      {0200, me, mine, true},
      {0577, me, mine, false},
      {0200, me, kOtherUser, true},
      {0577, me, kOtherUser, false},
      {0020, kOtherUser, mine, true},
      {0757, kOtherUser, mine, false},
      {0002, kOtherUser, kOtherUser, true},
      {0775, kOtherUser, kOtherUser, false},
      {0777, kOtherUser, kOtherUser, true},
      {0000, me, mine, false},
  };
  for (const auto& c : cases) {
    EXPECT_EQ(vexa::attributes_of(status_of(S_IFDIR | c.permissions, c.user, c.group)), c.writable ? 8U : 0x208U)
        << std::oct << c.permissions;
    for (const mode_t type : {S_IFREG, S_IFCHR, S_IFBLK, S_IFIFO, S_IFSOCK}) {
      EXPECT_EQ(vexa::attributes_of(status_of(type | c.permissions, c.user, c.group)), c.writable ? 0x40U : 0x200U)
          << std::oct << c.permissions;
    }
  }
}

TEST(FileAttributes, OneWriteBitDecidesEvenForASuperuser) {
  const TemporaryFolder folder;
  const std::string path = folder.make_file("mine");
  ASSERT_EQ(chmod(path.c_str(), 0477), 0);
  EXPECT_EQ(GetFileAttributes(path.c_str()), 0x200U);
  ASSERT_EQ(chmod(path.c_str(), 0200), 0);
  EXPECT_EQ(GetFileAttributes(path.c_str()), 0x40U);
}

TEST(FileAttributes, AreThoseOfTheCallingUser) {
  const TemporaryFolder folder;
  ASSERT_EQ(chmod(folder.path().c_str(), 0755), 0);
  const std::string closed = folder.make_folder("closed");
  const std::string open = folder.make_folder("open");
  const std::string file = folder.make_file("file");
  ASSERT_EQ(chmod(closed.c_str(), 0755), 0);
  ASSERT_EQ(chmod(open.c_str(), 0777), 0);
  ASSERT_EQ(chmod(file.c_str(), 0644), 0);
  EXPECT_EQ(GetFileAttributes(closed.c_str()), 8U);
  if (geteuid() != 0) return;
  EXPECT_EQ(in_child([&] {
              if (!become_unprivileged()) return std::string("still privileged");
              return std::to_string(GetFileAttributes(closed.c_str())) + " " +
                     std::to_string(GetFileAttributes(open.c_str())) + " " +
                     std::to_string(GetFileAttributes(file.c_str()));
            }),
            std::to_string(8 | 0x200) + " 8 " + std::to_string(0x200));
}

TEST(FileAttributes, AFolderWithoutWritePermissionIsReadOnly) {
  const TemporaryFolder folder;
  ASSERT_EQ(chmod(folder.path().c_str(), 0555), 0);
  EXPECT_EQ(GetFileAttributes(folder.path().c_str()), std::uint32_t{8 | 0x200});
  ASSERT_EQ(chmod(folder.path().c_str(), 0755), 0);
}

TEST(GetFileAttributes, IsSilentForAMissingPathAlone) {
  const TemporaryFolder folder;
  const std::string file = folder.make_file("file");
  EXPECT_EQ(stderr_of([&] { EXPECT_EQ(GetFileAttributes((folder / "gone").c_str()), kFailed); }), "");
  EXPECT_EQ(stderr_of([&] { EXPECT_EQ(GetFileAttributes(""), kFailed); }), "");
  EXPECT_EQ(stderr_of([&] { EXPECT_EQ(GetFileAttributes(nullptr), kFailed); }), "");
  EXPECT_EQ(stderr_of([&] { EXPECT_EQ(GetFileAttributes((file + "/x").c_str()), kFailed); }),
            "GetFileAttributes stat " + file + "/x: Not a directory\n");
  const std::string long_name(4096, 'n');
  EXPECT_EQ(stderr_of([&] { EXPECT_EQ(GetFileAttributes(long_name.c_str()), kFailed); }),
            "GetFileAttributes stat " + long_name + ": File name too long\n");
}

TEST(GetFileAttributes, PrintsAPathAsItIs) {
  EXPECT_EQ(stderr_of([] { GetFileAttributes("/dev/null/%n%s%d"); }),
            "GetFileAttributes stat /dev/null/%n%s%d: Not a directory\n");
}

TEST(GetFileAttributesEx, FillsItsRecord) {
  const TemporaryFolder folder;
  const std::string path = folder.make_file("file", "12345");
  const timespec times[] = {{0, 999999999}, {1234567890, 1}};
  ASSERT_EQ(utimensat(AT_FDCWD, path.c_str(), times, 0), 0);
  WIN32_FILE_ATTRIBUTE_DATA data;
  std::memset(&data, 0x5A, sizeof data);
  EXPECT_EQ(GetFileAttributesEx(path.c_str(), GetFileExInfoStandard, &data), 1);
  EXPECT_EQ(data.dwFileAttributes, 0x40U);
  EXPECT_EQ(data.ftCreationTime.dwLowDateTime, 0U);
  EXPECT_EQ(data.ftCreationTime.dwHighDateTime, 0U);
  // 116444736000000000 and 1234567890 * 10000000 + 116444736000000000
  EXPECT_EQ(data.ftLastAccessTime.dwHighDateTime, 0x19DB1DEU);
  EXPECT_EQ(data.ftLastAccessTime.dwLowDateTime, 0xD53E8000U);
  EXPECT_EQ(data.ftLastWriteTime.dwHighDateTime, 0x1C98E33U);
  EXPECT_EQ(data.ftLastWriteTime.dwLowDateTime, 0x3296F500U);
  EXPECT_EQ(data.nFileSizeHigh, 0U);
  EXPECT_EQ(data.nFileSizeLow, 5U);
}

TEST(GetFileAttributesEx, ReportsTheLowHalfOfALargeSize) {
  const TemporaryFolder folder;
  const std::string path = folder.make_file("large");
  ASSERT_EQ(truncate64(path.c_str(), (off64_t{5} << 32) + 7), 0);
  WIN32_FILE_ATTRIBUTE_DATA data;
  EXPECT_EQ(GetFileAttributesEx(path.c_str(), GetFileExInfoStandard, &data), 1);
  EXPECT_EQ(data.nFileSizeHigh, 0U);
  EXPECT_EQ(data.nFileSizeLow, 7U);
}

TEST(GetFileAttributesEx, RefusesOtherLevels) {
  for (const std::int32_t level : {1, -1, 0x7FFFFFFF}) {
    WIN32_FILE_ATTRIBUTE_DATA data;
    EXPECT_EQ(stderr_of([&] {
                EXPECT_EQ(GetFileAttributesEx("/tmp", static_cast<_GET_FILEEX_INFO_LEVELS>(level), &data), 0);
              }),
              "GetFileAttributesEx : only level GetFileExInfoStandard is supported\n");
  }
}

TEST(GetFileAttributesEx, ReportsWhyAPathCannotBeRead) {
  WIN32_FILE_ATTRIBUTE_DATA data;
  EXPECT_EQ(stderr_of([&] { EXPECT_EQ(GetFileAttributesEx("/gone/%s", GetFileExInfoStandard, &data), 0); }),
            "GetFileAttributesEx stat /gone/%s: No such file or directory\n");
  EXPECT_EQ(stderr_of([&] { EXPECT_EQ(GetFileAttributesEx(nullptr, GetFileExInfoStandard, &data), 0); }),
            "GetFileAttributesEx stat : No such file or directory\n");
}

TEST(GetFileAttributesEx, WithoutARecordIsZero) {
  EXPECT_EQ(stderr_of([] { EXPECT_EQ(GetFileAttributesEx("/tmp", GetFileExInfoStandard, nullptr), 0); }), "");
}

TEST(FileTime, CountsWholeSecondsInTicksSince1601) {
  const struct {
    std::int64_t seconds;
    std::uint32_t high, low;
  } cases[] = {{0, 0x19DB1DE, 0xD53E8000},
               {1, 0x19DB1DE, 0xD5D71680},
               {-1, 0x19DB1DE, 0xD4A5E980},
               {-11644473600, 0, 0},
               {0x7FFFFFFF, 0x1E9FD1E, 0xD4A5E980}};
  for (const auto& c : cases) {
    EXPECT_EQ(vexa::file_time_of_unix(c.seconds).dwHighDateTime, c.high) << c.seconds;
    EXPECT_EQ(vexa::file_time_of_unix(c.seconds).dwLowDateTime, c.low) << c.seconds;
  }
}

TEST(GetDiskFreeSpaceEx, ReportsTheSystemsBlocksInBytes) {
  const TemporaryFolder folder;
  struct statvfs64 system {};
  ASSERT_EQ(statvfs64(folder.path().c_str(), &system), 0);
  ULARGE_INTEGER available, total, free;
  EXPECT_EQ(GetDiskFreeSpaceEx(folder.path().c_str(), &available, &total, &free), 1);
  EXPECT_EQ(total.QuadPart, std::uint64_t{system.f_blocks} * system.f_frsize);
  EXPECT_LE(available.QuadPart, total.QuadPart);
  EXPECT_LE(available.QuadPart, free.QuadPart);
  EXPECT_LE(free.QuadPart, total.QuadPart);
}

TEST(GetDiskFreeSpaceEx, CountsIn64BitsAndInFragments) {
  struct statvfs64 system {};
  system.f_bsize = 1 << 20;
  system.f_frsize = 4096;
  const ULARGE_INTEGER bytes = vexa::bytes_of(system, 0x100000001);
  EXPECT_EQ(bytes.QuadPart, 0x100000001000U);
  EXPECT_EQ(bytes.LowPart, 0x1000U);
  EXPECT_EQ(bytes.HighPart, 0x1000U);
}

TEST(GetDiskFreeSpaceEx, DistinguishesAvailableAllAndFreeBlocks) {
  struct statvfs64 system {};
  system.f_frsize = 512;
  system.f_blocks = 5;
  system.f_bfree = 3;
  system.f_bavail = 2;
  const auto space = vexa::space_of(system);
  ASSERT_TRUE(space);
  EXPECT_EQ(space->available.QuadPart, 1024U);
  EXPECT_EQ(space->total.QuadPart, 2560U);
  EXPECT_EQ(space->free.QuadPart, 1536U);
}

TEST(GetDiskFreeSpaceEx, ABlockSizeOf0IsAFailure) {
  struct statvfs64 system {};
  system.f_blocks = system.f_bfree = system.f_bavail = 5;
  EXPECT_FALSE(vexa::space_of(system));
}

TEST(GetDiskFreeSpaceEx, SkipsNullOutputs) {
  ULARGE_INTEGER value;
  value.QuadPart = 0;
  EXPECT_EQ(GetDiskFreeSpaceEx("/", nullptr, nullptr, nullptr), 1);
  EXPECT_EQ(GetDiskFreeSpaceEx("/", nullptr, &value, nullptr), 1);
  EXPECT_NE(value.QuadPart, 0U);
}

TEST(GetDiskFreeSpaceEx, NullIsTheWorkingFolder) {
  struct statvfs64 here {};
  ASSERT_EQ(statvfs64(".", &here), 0);
  ULARGE_INTEGER total;
  EXPECT_EQ(GetDiskFreeSpaceEx(nullptr, nullptr, &total, nullptr), 1);
  EXPECT_EQ(total.QuadPart, std::uint64_t{here.f_blocks} * here.f_frsize);
}

TEST(GetDiskFreeSpaceEx, ReportsItsFailureAndKeepsErrno) {
  ULARGE_INTEGER value;
  value.QuadPart = 42;
  int error = 0;
  EXPECT_EQ(stderr_of([&] {
              errno = 0;
              EXPECT_EQ(GetDiskFreeSpaceEx("/gone/%d", &value, &value, &value), 0);
              error = errno;
            }),
            "GetDiskFreeSpaceEx statfs /gone/%d: No such file or directory\n");
  EXPECT_EQ(error, ENOENT);
  EXPECT_EQ(value.QuadPart, 42U);
}

}  // namespace
}  // namespace vexa_test
