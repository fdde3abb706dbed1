// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <string>
#include <utility>
#include <vector>

#include "runtime/handle.h"
#include "tests/support/folder_fixture.h"
#include "tests/support/in_child.h"
#include "tests/support/log_text.h"
#include "vexa/file_logger.h"

namespace vexa_test {
namespace {

class RotatingLogger : public CFileLogger {
 public:
  RotatingLogger(const std::string& name, int kilobytes, int copies) {
    m_MaxSize = kilobytes;
    m_CopyCount = copies;
    SetFileName(name.c_str());
    OpenFile();
  }

  using CFileLogger::CycleCloseFile;
  using CFileLogger::CycleFiles;
  using CFileLogger::CycleOpenFile;
  using CFileLogger::m_FileId;
  using CFileLogger::m_FileInfoList;

  const FileInfo& entry() const { return m_FileInfoList.at(m_FileId); }
};

/// A file that was rotated away after one text.
std::string ended(const std::string& text) { return opening_banner() + text + closing_banner(); }

using FileLoggerRotation = InTemporaryFolder;

TEST_F(FileLoggerRotation, ComesAtExactlyTheLimit) {
  const struct {
    int kilobytes;
    std::size_t size;
    bool rotated;
  } cases[] = {{1, 1023, false},           {1, 1024, true},       {1, 1025, true},
               {64, 64 * 1024 - 1, false}, {64, 64 * 1024, true}, {1024, 1024 * 1024 - 1, false},
               {1024, 1024 * 1024, true},  {-1, 200, true},       {0x7FFFFFFF, 100000, false}};
  for (const auto& c : cases) {
    const TemporaryFolder folder;
    RotatingLogger logger(folder / "Log.txt", c.kilobytes, 1);
    logger.Log(text_up_to(c.size).c_str());
    EXPECT_EQ(is_there(folder / "Log1.txt"), c.rotated) << c.kilobytes << " " << c.size;
    EXPECT_EQ(log_text(folder / "Log.txt"), opening_banner() + (c.rotated ? "" : text_up_to(c.size)));
  }
}

TEST_F(FileLoggerRotation, CountsWhatTheFileHeldBefore) {
  const std::string old(1023 - opening_banner().size(), 'o');
  folder_.make_file("Log.txt", old);
  RotatingLogger logger(folder_ / "Log.txt", 1, 1);
  EXPECT_FALSE(is_there(folder_ / "Log1.txt"));
  logger.Log("1");
  EXPECT_EQ(log_text(folder_ / "Log1.txt"), old + ended("1"));
}

TEST_F(FileLoggerRotation, MovesEachCopyUpAndDropsTheLast) {
  RotatingLogger logger(folder_ / "Log.txt", 0, 3);
  for (const char* text : {"1", "2", "3", "4", "5"}) logger.Log(text);
  EXPECT_EQ(log_text(folder_ / "Log.txt"), opening_banner());
  EXPECT_EQ(log_text(folder_ / "Log1.txt"), ended("5"));
  EXPECT_EQ(log_text(folder_ / "Log2.txt"), ended("4"));
  EXPECT_EQ(log_text(folder_ / "Log3.txt"), ended("3"));
  EXPECT_FALSE(is_there(folder_ / "Log4.txt"));
}

TEST_F(FileLoggerRotation, ALimitOfZeroRotatesAfterEveryWrite) {
  RotatingLogger logger(folder_ / "Log.txt", 0, 1);
  logger.Log("1");
  EXPECT_EQ(log_text(folder_ / "Log1.txt"), ended("1"));
  logger.Log("");
  EXPECT_EQ(log_text(folder_ / "Log1.txt"), ended(""));
}

TEST_F(FileLoggerRotation, ALimitAndACopyCountOfZeroMeanNoLimit) {
  RotatingLogger logger(folder_ / "Log.txt", 0, 0);
  logger.Log("1");
  logger.Log("2");
  EXPECT_EQ(log_text(folder_ / "Log.txt"), opening_banner() + "12");
}

TEST_F(FileLoggerRotation, WithoutCopiesTheSameFileGrowsAndEveryLineRotatesAgain) {
  for (const int copies : {0, -1}) {
    const TemporaryFolder folder;
    RotatingLogger logger(folder / "Log.txt", 1, copies);
    const std::string full = text_up_to(1024);
    logger.Log(full.c_str());
    EXPECT_EQ(log_text(folder / "Log.txt"), ended(full) + opening_banner());
    logger.Log("2");
    logger.Log("3");
    EXPECT_EQ(log_text(folder / "Log.txt"), ended(full) + ended("2") + ended("3") + opening_banner());
    EXPECT_FALSE(is_there(folder / "Log1.txt"));
  }
}

TEST_F(FileLoggerRotation, TheNumberComesBeforeTheExtension) {
  const struct {
    const char* name;
    const char* copy;
  } cases[] = {{"Log", "Log1"},         {"a.b/Log", "a.b/Log1"},     {"a.b/Log.tar.gz", "a.b/Log.tar1.gz"},
               {".hidden", "1.hidden"}, {"a.b//Log.", "a.b//Log1."}, {"%n%s.txt", "%n%s1.txt"}};
  for (const auto& c : cases) {
    const TemporaryFolder folder;
    folder.make_folder("a.b");
    RotatingLogger logger(folder / c.name, 0, 1);
    logger.Log("1");
    EXPECT_EQ(log_text(folder / c.copy), ended("1")) << c.name;
    EXPECT_EQ(log_text(folder / c.name), opening_banner()) << c.name;
  }
}

TEST_F(FileLoggerRotation, NamesTheFilesOfTheWorkingFolder) {
  EXPECT_EQ(in_child([&] {
              if (chdir(folder_.path().c_str()) != 0) return std::string("no folder");
              RotatingLogger logger("Log.txt", 0, 2);
              logger.Log("1");
              logger.Log("2");
              return log_text("Log2.txt") + log_text("Log1.txt") + log_text("Log.txt");
            }),
            ended("1") + ended("2") + opening_banner());
}

TEST_F(FileLoggerRotation, IsThatOfTheFileNotOfTheNameSetSince) {
  RotatingLogger logger(folder_ / "Log.txt", 0, 1);
  logger.SetFileName((folder_ / "Other.txt").c_str());
  logger.Log("1");
  EXPECT_EQ(log_text(folder_ / "Log1.txt"), ended("1"));
  EXPECT_FALSE(is_there(folder_ / "Other.txt"));
  EXPECT_FALSE(is_there(folder_ / "Other1.txt"));
}

TEST_F(FileLoggerRotation, SharersGoOnInTheNewFile) {
  RotatingLogger small(folder_ / "Log.txt", 0, 1);
  RotatingLogger large(folder_ / "Log.txt", 1024, 1);
  large.Log("a");
  small.Log("b");
  large.Log("c");
  EXPECT_EQ(small.m_FileId, large.m_FileId);
  EXPECT_EQ(small.entry().referenceCount, 2);
  EXPECT_EQ(log_text(folder_ / "Log1.txt"), ended("ab"));
  EXPECT_EQ(log_text(folder_ / "Log.txt"), opening_banner() + "c");
}

TEST_F(FileLoggerRotation, ACopyThatCannotBeMovedEndsItAndNothingIsLost) {
  folder_.make_folder("Log2.txt/in the way");
  folder_.make_file("Log1.txt", "older");
  RotatingLogger logger(folder_ / "Log.txt", 0, 2);
  const std::string one = folder_ / "Log1.txt";
  const std::string two = folder_ / "Log2.txt";
  EXPECT_EQ(stderr_of([&] { logger.Log("1"); }), "DeleteFile unlink " + two + ": Is a directory\nMoveFile rename " +
                                                     one + " to " + two + ": Is a directory\n");
  EXPECT_EQ(contents_of(one), "older");
  EXPECT_EQ(log_text(folder_ / "Log.txt"), ended("1") + opening_banner());
}

TEST_F(FileLoggerRotation, ANameWithoutRoomForTheNumberIsNotDeleted) {
  const std::string name(255, 'n');
  RotatingLogger logger(folder_ / name, 0, 2);
  logger.Log("1");
  logger.Log("2");
  EXPECT_EQ(log_text(folder_ / name), ended("1") + ended("2") + opening_banner());
}

TEST_F(FileLoggerRotation, ACopysNameIsCutAt255Characters) {
  const std::string name(254, 'n');
  RotatingLogger logger(folder_ / name, 0, 1);
  logger.Log("1");
  EXPECT_EQ(log_text(folder_ / (name + "1")), ended("1"));
}

TEST_F(FileLoggerRotation, AfterAFailedReopeningNothingIsWrittenUntilAllHaveLeft) {
  const std::string path = folder_.make_folder("sub") + "/Log.txt";
  RotatingLogger first(path, 0, 1);
  RotatingLogger second(path, 0, 1);
  ASSERT_EQ(unlink(path.c_str()), 0);
  ASSERT_EQ(rmdir((folder_ / "sub").c_str()), 0);
  EXPECT_EQ(stderr_of([&] { first.Log("1"); }), "CreateFile fopen " + path + ": No such file or directory\n");
  EXPECT_EQ(first.entry().fileHandle, nullptr);
  EXPECT_EQ(first.entry().referenceCount, 2);
  folder_.make_folder("sub");
  EXPECT_EQ(stderr_of([&] {
              first.Log("2");
              second.Log("3");
              first.OpenFile();
              first.Log("4");
            }),
            "");
  EXPECT_FALSE(is_there(path));
  first.CloseFile();
  second.CloseFile();
  first.OpenFile();
  EXPECT_EQ(log_text(path), opening_banner());
}

TEST_F(FileLoggerRotation, AFailedSizeQuerySkipsIt) {
  RotatingLogger logger(folder_ / "Log.txt", 0, 1);
  auto* file = vexa::record_of<vexa::FileHandle>(logger.entry().fileHandle);
  const int descriptor = std::exchange(file->fd, -1);
  EXPECT_EQ(stderr_of([&] { logger.CycleFiles(); }), "GetFileSize fstat: Bad file descriptor\n");
  file->fd = descriptor;
  EXPECT_FALSE(is_there(folder_ / "Log1.txt"));
  EXPECT_EQ(log_text(folder_ / "Log.txt"), opening_banner());
}

TEST_F(FileLoggerRotation, OpeningAFileThatIsOpenKeepsIt) {
  RotatingLogger logger(folder_ / "Log.txt", 1, 1);
  logger.CycleOpenFile();
  EXPECT_EQ(log_text(folder_ / "Log.txt"), opening_banner());
  logger.CycleCloseFile();
  logger.CycleCloseFile();
  EXPECT_EQ(log_text(folder_ / "Log.txt"), opening_banner() + closing_banner());
}

}  // namespace
}  // namespace vexa_test
