// SPDX-License-Identifier: Apache-2.0
#include "host/cgi_log/followed_file.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <array>
#include <filesystem>

#include "tests/support/temporary_folder.h"

namespace vexa::host {
namespace {

class FollowedFileTest : public testing::Test {
 protected:
  FollowedFileTest() : path_(folder_.make_file("log", "one")), file_(path_) {}

  std::string read() {
    std::string text;
    std::array<char, 2> room{};
    for (;;) {
      const auto count = file_.read(room);
      if (!count) return count.error().text;
      if (*count == 0) return text;
      text.append(room.data(), *count);
    }
  }

  void append(const std::string& name, const std::string& text) const {
    std::ofstream(folder_ / name, std::ios::binary | std::ios::app) << text;
  }

  const vexa_test::TemporaryFolder folder_;
  const std::string path_;
  FollowedFile file_;
};

TEST_F(FollowedFileTest, ReadsOnWhatIsAppended) {
  ASSERT_FALSE(file_.open());
  EXPECT_TRUE(file_.is_regular());
  EXPECT_EQ(read(), "one");
  EXPECT_FALSE(file_.begin_successor());
  append("log", "two");
  EXPECT_EQ(read(), "two");
}

TEST_F(FollowedFileTest, GoesOnWithTheFileThatTookItsName) {
  ASSERT_FALSE(file_.open());
  EXPECT_EQ(read(), "one");
  std::filesystem::rename(path_, folder_ / "log1");
  EXPECT_FALSE(file_.begin_successor());
  append("log", "new");
  append("log1", "last");
  EXPECT_FALSE(file_.begin_successor());
  EXPECT_EQ(read(), "last");
  EXPECT_TRUE(file_.begin_successor());
  EXPECT_EQ(read(), "new");
  EXPECT_FALSE(file_.begin_successor());
}

TEST_F(FollowedFileTest, BeginsAgainWhenTheFileIsEmptied) {
  ASSERT_FALSE(file_.open());
  EXPECT_EQ(read(), "one");
  ASSERT_EQ(truncate(path_.c_str(), 0), 0);
  append("log", "1");
  EXPECT_TRUE(file_.begin_successor());
  EXPECT_EQ(read(), "1");
}

TEST_F(FollowedFileTest, AMissingFileIsAProblem) {
  std::filesystem::remove(path_);
  const auto problem = file_.open();
  ASSERT_TRUE(problem);
  EXPECT_EQ(problem->code, ExitCode::kUsage);
  EXPECT_EQ(problem->text, "cannot read " + path_ + ": No such file or directory");
}

TEST_F(FollowedFileTest, AFolderIsAProblemAtTheFirstRead) {
  FollowedFile folder(folder_.path());
  ASSERT_FALSE(folder.open());
  EXPECT_FALSE(folder.is_regular());
  std::array<char, 1> room{};
  const auto count = folder.read(room);
  ASSERT_FALSE(count);
  EXPECT_EQ(count.error().text, "cannot read " + folder_.path() + ": Is a directory");
}

}  // namespace
}  // namespace vexa::host
