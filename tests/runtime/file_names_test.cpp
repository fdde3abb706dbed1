// SPDX-License-Identifier: Apache-2.0
// Making, moving and removing files and directories by name.
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <string>

#include "tests/support/in_child.h"
#include "tests/support/temporary_folder.h"
#include "vexa/runtime.h"

namespace vexa_test {
namespace {

TEST(CreateDirectory, MakesADirectoryOfMode0755) {
  const TemporaryFolder folder;
  EXPECT_EQ(in_child([&] {
              umask(0);
              struct stat status {};
              const int result = CreateDirectory((folder / "new").c_str(), nullptr);
              stat((folder / "new").c_str(), &status);
              return std::to_string(result) + " " + std::to_string(status.st_mode);
            }),
            "1 " + std::to_string(S_IFDIR | 0755));
}

TEST(CreateDirectory, RefusesSecurityAttributes) {
  const TemporaryFolder folder;
  _SECURITY_ATTRIBUTES rights = {};
  EXPECT_EQ(stderr_of([&] { EXPECT_EQ(CreateDirectory((folder / "new").c_str(), &rights), 0); }),
            "CreateDirectory : no support for security attributes yet\n");
  EXPECT_FALSE(is_there(folder / "new"));
}

TEST(RemoveDirectory, RemovesAnEmptyDirectory) {
  const TemporaryFolder folder;
  const std::string path = folder.make_folder("sub");
  EXPECT_EQ(RemoveDirectory(path.c_str()), 1);
  EXPECT_FALSE(is_there(path));
}

TEST(MoveFile, MovesAndReplaces) {
  const TemporaryFolder folder;
  const std::string from = folder.make_file("from", "new");
  const std::string to = folder.make_file("to", "old");
  EXPECT_EQ(MoveFile(from.c_str(), to.c_str()), 1);
  EXPECT_FALSE(is_there(from));
  EXPECT_EQ(contents_of(to), "new");
}

TEST(DeleteFile, RemovesAFile) {
  const TemporaryFolder folder;
  const std::string path = folder.make_file("file");
  EXPECT_EQ(DeleteFile(path.c_str()), 1);
  EXPECT_FALSE(is_there(path));
}

TEST(FileNames, EachFailureIsReportedWithItsPath) {
  const TemporaryFolder folder;
  const std::string file = folder.make_file("file");
  const std::string full = folder.make_folder("full");
  folder.make_file("full/file");
  const std::string odd = folder / "%n%s/x";
  const std::string long_name(4096, 'n');
  const struct {
    int (*call)(const char*);
    std::string path, text;
  } cases[] = {
      {[](const char* path) { return CreateDirectory(path, nullptr); }, full,
       "CreateDirectory mkdir " + full + ": File exists\n"},
      {[](const char* path) { return CreateDirectory(path, nullptr); }, odd,
       "CreateDirectory mkdir " + odd + ": No such file or directory\n"},
      {[](const char* path) { return CreateDirectory(path, nullptr); }, long_name,
       "CreateDirectory mkdir " + long_name + ": File name too long\n"},
      {RemoveDirectory, full, "RemoveDirectory rmdir " + full + ": Directory not empty\n"},
      {RemoveDirectory, odd, "RemoveDirectory rmdir " + odd + ": No such file or directory\n"},
      {RemoveDirectory, file, "RemoveDirectory rmdir " + file + ": Not a directory\n"},
      {DeleteFile, odd, "DeleteFile unlink " + odd + ": No such file or directory\n"},
      {DeleteFile, full, "DeleteFile unlink " + full + ": Is a directory\n"},
      {[](const char* path) { return MoveFile(path, "/gone/%d"); }, odd,
       "MoveFile rename " + odd + " to /gone/%d: No such file or directory\n"},
  };
  for (const auto& c : cases) EXPECT_EQ(stderr_of([&] { EXPECT_EQ(c.call(c.path.c_str()), 0); }), c.text);
}

TEST(FileNames, NullCountsAsTheEmptyPath) {
  EXPECT_EQ(stderr_of([] { EXPECT_EQ(CreateDirectory(nullptr, nullptr), 0); }),
            "CreateDirectory mkdir : No such file or directory\n");
  EXPECT_EQ(stderr_of([] { EXPECT_EQ(RemoveDirectory(nullptr), 0); }),
            "RemoveDirectory rmdir : No such file or directory\n");
  EXPECT_EQ(stderr_of([] { EXPECT_EQ(DeleteFile(nullptr), 0); }), "DeleteFile unlink : No such file or directory\n");
  EXPECT_EQ(stderr_of([] { EXPECT_EQ(MoveFile(nullptr, nullptr), 0); }),
            "MoveFile rename  to : No such file or directory\n");
}

TEST(FileNames, AnUnprivilegedUsersRefusalIsReported) {
  const TemporaryFolder folder;
  const std::string file = folder.make_file("file");
  const std::string sub = folder.make_folder("sub");
  const std::string fresh = folder / "new";
  ASSERT_EQ(chmod(folder.path().c_str(), 0555), 0);
  const std::string report = in_child([&] {
    if (!become_unprivileged()) return std::string("still privileged");
    return stderr_of([&] {
      CreateDirectory(fresh.c_str(), nullptr);
      RemoveDirectory(sub.c_str());
      MoveFile(file.c_str(), fresh.c_str());
      DeleteFile(file.c_str());
    });
  });
  ASSERT_EQ(chmod(folder.path().c_str(), 0755), 0);
  EXPECT_EQ(report, "CreateDirectory mkdir " + fresh + ": Permission denied\nRemoveDirectory rmdir " + sub +
                        ": Permission denied\nMoveFile rename " + file + " to " + fresh +
                        ": Permission denied\nDeleteFile unlink " + file + ": Permission denied\n");
}

}  // namespace
}  // namespace vexa_test
