// SPDX-License-Identifier: Apache-2.0
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstddef>
#include <cstring>
#include <string>
#include <vector>

#include "runtime/handle.h"
#include "tests/support/failing_new.h"
#include "tests/support/in_child.h"
#include "tests/support/process_state.h"
#include "tests/support/temporary_folder.h"
#include "vexa/runtime.h"

namespace vexa_test {
namespace {

constexpr char kInvalidFindHandle[] = "checkFindFirstFileHandle : called with invalid handle\n";

_WIN32_FIND_DATA marked_data() {
  _WIN32_FIND_DATA data;
  std::memset(&data, 0x5A, sizeof data);
  return data;
}

bool untouched(const _WIN32_FIND_DATA& data) {
  const _WIN32_FIND_DATA fresh = marked_data();
  return std::memcmp(&data, &fresh, sizeof data) == 0;
}

TEST(FindFirstFile, DescribesAFile) {
  const TemporaryFolder folder;
  const std::string path = folder.make_file("picture.jpg", "twelve bytes");
  const timespec times[] = {{1000000000, 999999999}, {1234567890, 1}};
  ASSERT_EQ(utimensat(AT_FDCWD, path.c_str(), times, 0), 0);
  _WIN32_FIND_DATA data = marked_data();
  typedHandle* search = FindFirstFile((folder / "*.jpg").c_str(), &data);
  ASSERT_NE(search, nullptr);
  EXPECT_EQ(search->kind, HANDLE_TYPE_FIND);
  EXPECT_EQ(data.dwFileAttributes, 0x40U);
  EXPECT_EQ(data.ftCreationTime.dwLowDateTime, 0U);
  EXPECT_EQ(data.ftCreationTime.dwHighDateTime, 0U);
  // 1000000000 * 10000000 + 116444736000000000 and 1234567890 * 10000000 + 116444736000000000
  EXPECT_EQ(data.ftLastAccessTime.dwHighDateTime, 0x1C138D1U);
  EXPECT_EQ(data.ftLastAccessTime.dwLowDateTime, 0x44FF8000U);
  EXPECT_EQ(data.ftLastWriteTime.dwHighDateTime, 0x1C98E33U);
  EXPECT_EQ(data.ftLastWriteTime.dwLowDateTime, 0x3296F500U);
  EXPECT_EQ(data.nFileSizeHigh, 0U);
  EXPECT_EQ(data.nFileSizeLow, 12U);
  EXPECT_STREQ(data.cFileName, "picture.jpg");
  EXPECT_STREQ(data.cAlternateFileName, "xxxxxxxx.xxx");
  EXPECT_EQ(FindClose(search), 1);
}

TEST(FindFile, DataIsLaidOutAsHostsReadIt) {
  EXPECT_EQ(offsetof(_WIN32_FIND_DATA, dwFileAttributes), 0U);
  EXPECT_EQ(offsetof(_WIN32_FIND_DATA, ftCreationTime), 4U);
  EXPECT_EQ(offsetof(_WIN32_FIND_DATA, ftLastAccessTime), 12U);
  EXPECT_EQ(offsetof(_WIN32_FIND_DATA, ftLastWriteTime), 20U);
  EXPECT_EQ(offsetof(_WIN32_FIND_DATA, nFileSizeHigh), 28U);
  EXPECT_EQ(offsetof(_WIN32_FIND_DATA, nFileSizeLow), 32U);
  EXPECT_EQ(offsetof(_WIN32_FIND_DATA, dwReserved0), 36U);
  EXPECT_EQ(offsetof(_WIN32_FIND_DATA, dwReserved1), 40U);
  EXPECT_EQ(offsetof(_WIN32_FIND_DATA, cFileName), 44U);
  EXPECT_EQ(offsetof(_WIN32_FIND_DATA, cAlternateFileName), 4140U);
  EXPECT_EQ(sizeof(_WIN32_FIND_DATA::cAlternateFileName), 14U);
}

TEST(FindFirstFile, LeavesTheReservedWords) {
  _WIN32_FIND_DATA data = marked_data();
  typedHandle* search = FindFirstFile("/tmp", &data);
  ASSERT_NE(search, nullptr);
  EXPECT_EQ(data.dwReserved0, 0x5A5A5A5AU);
  EXPECT_EQ(data.dwReserved1, 0x5A5A5A5AU);
  EXPECT_EQ(FindClose(search), 1);
}

TEST(FindFirstFile, WithoutAMatchIsNullAndPrintsNothing) {
  const TemporaryFolder folder;
  for (const std::string& pattern : {folder / "*", folder / "gone", folder / "gone/*", std::string()}) {
    _WIN32_FIND_DATA data = marked_data();
    EXPECT_EQ(stderr_of([&] { EXPECT_EQ(FindFirstFile(pattern.c_str(), &data), nullptr) << pattern; }), "");
    EXPECT_TRUE(untouched(data));
  }
}

TEST(FindFirstFile, TreatsNullAsTheEmptyPattern) {
  _WIN32_FIND_DATA data = marked_data();
  EXPECT_EQ(stderr_of([&] { EXPECT_EQ(FindFirstFile(nullptr, &data), nullptr); }), "");
}

TEST(FindFirstFile, KeepsTheSearchWhenTheFirstMatchCannotBeRead) {
  const TemporaryFolder folder;
  ASSERT_EQ(symlink("nowhere", (folder / "a").c_str()), 0);
  folder.make_file("b");
  _WIN32_FIND_DATA data = marked_data();
  typedHandle* search = nullptr;
  EXPECT_EQ(stderr_of([&] { search = FindFirstFile((folder / "*").c_str(), &data); }),
            "_fillFileData stat: No such file or directory\n");
  ASSERT_NE(search, nullptr);
  EXPECT_TRUE(untouched(data));
  EXPECT_EQ(FindNextFile(search, &data), 1);
  EXPECT_STREQ(data.cFileName, "b");
  EXPECT_EQ(FindClose(search), 1);
}

TEST(FindFirstFile, FillsNothingWithoutARecord) {
  typedHandle* search = FindFirstFile("/tmp", nullptr);
  ASSERT_NE(search, nullptr);
  EXPECT_EQ(FindNextFile(search, nullptr), 0);
  EXPECT_EQ(FindClose(search), 1);
}

TEST(FindFirstFile, ReportsThatMemoryIsShortForTheHandleOrTheMatches) {
  const TemporaryFolder folder;
  folder.make_file("a long name that needs memory of its own");
  const std::string pattern = folder / "*";
  fails_at_every_allocation(
      [&pattern](Shortage& shortage) {
        typedHandle* search = nullptr;
        _WIN32_FIND_DATA data;
        const std::string text = stderr_of([&] {
          errno = ENOMEM;
          search = shortage.run([&] { return FindFirstFile(pattern.c_str(), &data); });
        });
        const std::string step = shortage.nth() == 0 ? "new" : "pathglob";
        EXPECT_EQ(text, shortage.failed() ? "FindFirstFile " + step + ": Cannot allocate memory\n" : "");
        EXPECT_EQ(search == nullptr, shortage.failed());
        EXPECT_TRUE(search == nullptr || FindClose(search) == 1);
      },
      4);
}

TEST(FindNextFile, GoesThroughTheMatchesInOrderAndEndsSilently) {
  const TemporaryFolder folder;
  for (const char* name : {"c", "a", "d", "b", ".hidden"}) folder.make_file(name, name);
  folder.make_folder("e");
  _WIN32_FIND_DATA data = marked_data();
  typedHandle* search = FindFirstFile((folder / "*").c_str(), &data);
  ASSERT_NE(search, nullptr);
  std::vector<std::string> names = {data.cFileName};
  const std::string text = stderr_of([&] {
    while (FindNextFile(search, &data) == 1) names.emplace_back(data.cFileName);
    data = marked_data();
    EXPECT_EQ(FindNextFile(search, &data), 0);
    EXPECT_EQ(FindNextFile(search, &data), 0);
  });
  EXPECT_EQ(names, (std::vector<std::string>{"a", "b", "c", "d", "e"}));
  EXPECT_EQ(text, "");
  EXPECT_TRUE(untouched(data));
  EXPECT_EQ(FindClose(search), 1);
}

TEST(FindNextFile, ReportsAMatchThatIsGoneAndGoesOnAfterIt) {
  const TemporaryFolder folder;
  for (const char* name : {"a", "b", "c"}) folder.make_file(name);
  _WIN32_FIND_DATA data = marked_data();
  typedHandle* search = FindFirstFile((folder / "?").c_str(), &data);
  ASSERT_NE(search, nullptr);
  ASSERT_EQ(unlink((folder / "b").c_str()), 0);
  EXPECT_EQ(stderr_of([&] { EXPECT_EQ(FindNextFile(search, &data), 0); }),
            "_fillFileData stat: No such file or directory\n");
  EXPECT_STREQ(data.cFileName, "a");
  EXPECT_EQ(FindNextFile(search, &data), 1);
  EXPECT_STREQ(data.cFileName, "c");
  EXPECT_EQ(FindClose(search), 1);
}

TEST(FindNextFile, NamesWhatFollowsTheLastSlash) {
  const TemporaryFolder folder;
  folder.make_folder("sub");
  _WIN32_FIND_DATA data = marked_data();
  typedHandle* search = FindFirstFile((folder / "*/").c_str(), &data);
  ASSERT_NE(search, nullptr);
  EXPECT_STREQ(data.cFileName, "");
  EXPECT_EQ(data.dwFileAttributes, 8U);
  EXPECT_EQ(FindClose(search), 1);

  search = FindFirstFile((folder / "s*").c_str(), &data);
  ASSERT_NE(search, nullptr);
  EXPECT_STREQ(data.cFileName, "sub");
  EXPECT_EQ(FindClose(search), 1);
}

TEST(FindFirstFile, FindsInTheWorkingFolderAndAtTheLongestName) {
  const TemporaryFolder folder;
  const std::string longest(255, 'n');
  folder.make_file(longest);
  EXPECT_EQ(in_child([&]() -> std::string {
              if (chdir(folder.path().c_str()) != 0) return "no folder";
              _WIN32_FIND_DATA data = marked_data();
              return FindFirstFile("*", &data) == nullptr ? "none" : data.cFileName;
            }),
            longest);
}

TEST(FindFirstFile, FindsNothingForAPatternOfFourKilobytes) {
  const std::string long_name(4096, 'n');
  for (const std::string& pattern : {long_name, "/tmp/" + long_name, long_name + "*", "~" + long_name}) {
    _WIN32_FIND_DATA data = marked_data();
    EXPECT_EQ(stderr_of([&] { EXPECT_EQ(FindFirstFile(pattern.c_str(), &data), nullptr); }), "");
  }
}

TEST(FindFile, RefusesNullAndOtherKinds) {
  typedHandle* event = CreateEvent(nullptr, 1, 0, nullptr);
  typedHandle* file = CreateFile("/dev/null", GENERIC_READ, 0, nullptr, OPEN_EXISTING, 0, nullptr);
  for (typedHandle* handle : {static_cast<typedHandle*>(nullptr), event, file}) {
    _WIN32_FIND_DATA data = marked_data();
    EXPECT_EQ(stderr_of([&] { EXPECT_EQ(FindNextFile(handle, &data), 0); }), kInvalidFindHandle);
    EXPECT_TRUE(untouched(data));
    EXPECT_EQ(stderr_of([&] { EXPECT_EQ(FindClose(handle), 0); }), kInvalidFindHandle);
  }
  EXPECT_EQ(CloseHandle(event), 1);
  EXPECT_EQ(CloseHandle(file), 1);
}

TEST(FindFile, KeepsNoDescriptorWhileItIsOpen) {
  const TemporaryFolder folder;
  folder.make_file("a");
  const std::size_t before = open_descriptors();
  _WIN32_FIND_DATA data;
  typedHandle* search = FindFirstFile((folder / "*").c_str(), &data);
  EXPECT_EQ(open_descriptors(), before);
  EXPECT_EQ(FindClose(search), 1);
}

}  // namespace
}  // namespace vexa_test
