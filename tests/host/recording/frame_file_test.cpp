// SPDX-License-Identifier: Apache-2.0
#include "host/recording/frame_file.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>

#include "tests/support/temporary_folder.h"

namespace vexa::host {
namespace {

using vexa_test::contents_of;
using vexa_test::TemporaryFolder;

constexpr unsigned char kBytes[] = {'a', 'b', 'c'};

std::string text_of(const std::optional<Problem>& problem) { return problem ? problem->text : ""; }

TEST(FrameFile, CreatesNothingUntilTheFirstPicture) {
  const TemporaryFolder folder;
  FrameFile file(folder / "live");
  EXPECT_FALSE(file.check());
  EXPECT_FALSE(std::filesystem::exists(folder / "live"));
  EXPECT_FALSE(file.write(kBytes, 2));
  EXPECT_FALSE(file.write(kBytes, 3));
  EXPECT_FALSE(file.close());
  EXPECT_EQ(contents_of(folder / "live"), "ababc");
}

TEST(FrameFile, ReplacesAFormerFileWithTheFirstPicture) {
  const TemporaryFolder folder;
  FrameFile file(folder.make_file("live", "former"));
  EXPECT_FALSE(file.check());
  EXPECT_EQ(contents_of(folder / "live"), "former");
  EXPECT_FALSE(file.write(kBytes, 1));
  EXPECT_FALSE(file.close());
  EXPECT_EQ(contents_of(folder / "live"), "a");
}

TEST(FrameFile, ReportsEarlyWhatOpeningWouldReport) {
  const TemporaryFolder folder;
  const std::string file_as_folder = folder.make_file("file") + "/live";
  EXPECT_EQ(text_of(FrameFile(folder.path()).check()), "cannot write " + folder.path() + ": Is a directory");
  EXPECT_EQ(text_of(FrameFile(folder / "no/live").check()),
            "cannot write " + (folder / "no/live") + ": No such file or directory");
  EXPECT_EQ(text_of(FrameFile(file_as_folder).check()), "cannot write " + file_as_folder + ": Not a directory");
}

TEST(FrameFile, KnowsTheFolderOfEveryPath) {
  EXPECT_FALSE(FrameFile("relative-file-that-does-not-exist").check());
  EXPECT_FALSE(FrameFile("/tmp/file-that-does-not-exist").check());
}

TEST(FrameFile, AnErrorOfTheSystemIsAProblemWithFive) {
  FrameFile full("/dev/full");
  const auto problem = full.write(kBytes, 3);
  ASSERT_TRUE(problem);
  EXPECT_EQ(problem->code, ExitCode::kCannotWrite);
  EXPECT_EQ(problem->text, "cannot write /dev/full: No space left on device");
  FrameFile nowhere("/no/such/folder/live");
  EXPECT_EQ(text_of(nowhere.write(kBytes, 3)), "cannot write /no/such/folder/live: No such file or directory");
}

TEST(FrameFile, LeavesAGivenDescriptorOpen) {
  int ends[2];
  ASSERT_EQ(pipe2(ends, O_CLOEXEC), 0);
  FrameFile file("standard output", ends[1]);
  EXPECT_FALSE(file.check());
  EXPECT_FALSE(file.write(kBytes, 3));
  EXPECT_FALSE(file.close());
  char read_back[4] = {};
  EXPECT_EQ(read(ends[0], read_back, 4), 3);
  EXPECT_STREQ(read_back, "abc");
  EXPECT_EQ(close(ends[1]), 0);
  EXPECT_EQ(close(ends[0]), 0);
}

}  // namespace
}  // namespace vexa::host
