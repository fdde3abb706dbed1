// SPDX-License-Identifier: Apache-2.0
#include "vexa/file_logger.h"

#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstddef>
#include <cstdlib>
#include <map>
#include <string>
#include <type_traits>

#include "runtime/base/sync.h"
#include "tests/support/folder_fixture.h"
#include "tests/support/in_child.h"
#include "tests/support/log_text.h"
#include "tests/support/process_state.h"
#include "vexa/real_time.h"

namespace vexa_test {
namespace {

/// A logger whose inside is open.
class OpenLogger : public CFileLogger {
 public:
  OpenLogger() = default;
  explicit OpenLogger(const std::string& name) {
    SetFileName(name.c_str());
    OpenFile();
  }

  using CFileLogger::CycleCloseFile;
  using CFileLogger::CycleFiles;
  using CFileLogger::CycleOpenFile;
  using CFileLogger::m_CopyCount;
  using CFileLogger::m_FileHandleSeed;
  using CFileLogger::m_FileId;
  using CFileLogger::m_FileInfoList;
  using CFileLogger::m_FileListLock;
  using CFileLogger::m_FileName;
  using CFileLogger::m_MaxSize;

  void limit(int kilobytes, int copies) {
    m_MaxSize = kilobytes;
    m_CopyCount = copies;
  }

  int references() const { return m_FileInfoList.at(m_FileId).referenceCount; }
};

// Its destructor runs after those of nearly all other statics.
OpenLogger early_logger __attribute__((init_priority(102)));

using FileLogger = InTemporaryFolder;

TEST_F(FileLogger, BeginsClosedWithItsDefaults) {
  const OpenLogger logger;
  EXPECT_EQ(logger.m_FileName, "Log.txt");
  EXPECT_EQ(logger.m_MaxSize, 1024);
  EXPECT_EQ(logger.m_CopyCount, 1);
  EXPECT_EQ(logger.m_FileId, 0);
}

TEST_F(FileLogger, HasItsStaticsUnderTheirNamesAndTypes) {
  static_assert(std::is_same<decltype(OpenLogger::m_FileHandleSeed), std::int64_t>::value, "seed");
  static_assert(std::is_same<std::remove_reference_t<decltype(OpenLogger::m_FileInfoList)>,
                             std::map<long long, CFileLogger::FileInfo>>::value,
                "list");
  static_assert(std::is_same<std::remove_reference_t<decltype(OpenLogger::m_FileListLock)>, CSimpleLock>::value,
                "lock");
}

TEST_F(FileLogger, HasItsMembersFirstAndInOrder) {
  const OpenLogger logger;
  const auto* begin = reinterpret_cast<const char*>(static_cast<const CFileLogger*>(&logger));
  const auto place = [begin](const void* member) {
    return static_cast<std::size_t>(static_cast<const char*>(member) - begin);
  };
  const std::size_t after_name = sizeof(void*) + sizeof(std::string);
  EXPECT_EQ(place(&logger.m_FileName), sizeof(void*));
  EXPECT_EQ(place(&logger.m_MaxSize), after_name);
  EXPECT_EQ(place(&logger.m_CopyCount), after_name + sizeof(int));
  EXPECT_EQ(place(&logger.m_FileId), after_name + 2 * sizeof(int));
  EXPECT_LT(offsetof(CFileLogger::FileInfo, fileName), offsetof(CFileLogger::FileInfo, fileHandle));
  EXPECT_LT(offsetof(CFileLogger::FileInfo, fileHandle), offsetof(CFileLogger::FileInfo, referenceCount));
}

TEST_F(FileLogger, SetFileNameIsTheSlotAfterTheDestructors) {
  struct Renamed : CFileLogger {
    void SetFileName(const char* name) override { given = name; }
    std::string given;
  };
  Renamed logger;
  CFileLogger* base = &logger;
  void* const* slots = *reinterpret_cast<void***>(base);
  reinterpret_cast<void (*)(CFileLogger*, const char*)>(slots[2])(base, "the third slot");
  EXPECT_EQ(logger.given, "the third slot");
}

TEST_F(FileLogger, AnEmptyOrNullNameKeepsThePreviousOne) {
  OpenLogger logger;
  logger.SetFileName("");
  logger.SetFileName(nullptr);
  EXPECT_EQ(logger.m_FileName, "Log.txt");
  logger.SetFileName("Other.txt");
  logger.SetFileName("");
  EXPECT_EQ(logger.m_FileName, "Other.txt");
}

TEST_F(FileLogger, WritesItsBannersAroundTheTextAsItIs) {
  OpenLogger logger(folder_ / "Log.txt");
  EXPECT_EQ(log_text(folder_ / "Log.txt"), opening_banner());
  logger.Log("first");
  logger.Log("\r\n%n%s%d\t");
  logger.Log("");
  EXPECT_EQ(log_text(folder_ / "Log.txt"), opening_banner() + "first\r\n%n%s%d\t");
  logger.CloseFile();
  EXPECT_EQ(log_text(folder_ / "Log.txt"), opening_banner() + "first\r\n%n%s%d\t" + closing_banner());
}

TEST_F(FileLogger, BannersTellTheLocalTime) {
  const CRealTime before = CRealTime::GetTheCurrentTime();
  { const OpenLogger logger(folder_ / "Log.txt"); }
  const std::string text = contents_of(folder_ / "Log.txt");
  for (const std::size_t at : {std::size_t{105}, text.find("\tLogFile Closed") - 23}) {
    CRealTime told;
    EXPECT_EQ(told.Scan(text.substr(at, 23).c_str(), "%D-%O-%Y %H:%M:%S.%L", false), 7);
    EXPECT_GE(told.Format("%Y%O%D%H%M%S%03L", true), before.Format("%Y%O%D%H%M%S%03L", true));
    EXPECT_LE(told.Format("%Y%O%D%H%M%S%03L", true), CRealTime::GetTheCurrentTime().Format("%Y%O%D%H%M%S%03L", true));
  }
}

TEST_F(FileLogger, ContinuesAFileThatIsThere) {
  folder_.make_file("Log.txt", "old");
  const OpenLogger logger(folder_ / "Log.txt");
  EXPECT_EQ(log_text(folder_ / "Log.txt"), "old" + opening_banner());
}

TEST_F(FileLogger, LoggersOfOneNameShareOneFile) {
  OpenLogger first(folder_ / "Log.txt");
  OpenLogger second(folder_ / "Log.txt");
  EXPECT_EQ(first.m_FileId, second.m_FileId);
  EXPECT_EQ(first.references(), 2);
  first.Log("1");
  second.Log("2");
  first.CloseFile();
  EXPECT_EQ(first.m_FileId, 0);
  first.Log("lost");
  second.Log("3");
  EXPECT_EQ(log_text(folder_ / "Log.txt"), opening_banner() + "123");
  second.CloseFile();
  EXPECT_EQ(log_text(folder_ / "Log.txt"), opening_banner() + "123" + closing_banner());
  second.CloseFile();
  EXPECT_EQ(log_text(folder_ / "Log.txt"), opening_banner() + "123" + closing_banner());
}

TEST_F(FileLogger, NamesAreSharedByTheirBytesAlone) {
  const OpenLogger first(folder_ / "Log.txt");
  const OpenLogger second(folder_ / "./Log.txt");
  const OpenLogger third(folder_ / "log.txt");
  EXPECT_NE(first.m_FileId, second.m_FileId);
  EXPECT_NE(first.m_FileId, third.m_FileId);
  EXPECT_EQ(first.references(), 1);
}

TEST_F(FileLogger, IdsCountUpAndAreNotUsedAgain) {
  const std::int64_t seed = OpenLogger::m_FileHandleSeed;
  OpenLogger first(folder_ / "1");
  EXPECT_EQ(first.m_FileId, seed + 1);
  EXPECT_EQ(OpenLogger(folder_ / "1").m_FileId, seed + 1);
  EXPECT_EQ(OpenLogger(folder_ / "2").m_FileId, seed + 2);
  EXPECT_EQ(OpenLogger(folder_ / "gone/3").m_FileId, 0);
  first.OpenFile();
  EXPECT_EQ(first.m_FileId, seed + 3);
  EXPECT_EQ(OpenLogger::m_FileHandleSeed, seed + 3);
}

TEST_F(FileLogger, OpeningLeavesTheFormerFile) {
  OpenLogger logger(folder_ / "1");
  logger.SetFileName((folder_ / "2").c_str());
  logger.Log("still the first");
  logger.OpenFile();
  logger.Log("the second");
  EXPECT_EQ(log_text(folder_ / "1"), opening_banner() + "still the first" + closing_banner());
  EXPECT_EQ(log_text(folder_ / "2"), opening_banner() + "the second");
  EXPECT_EQ(OpenLogger::m_FileInfoList.size(), 1U);
}

TEST_F(FileLogger, DestructionClosesItsShare) {
  const std::size_t before = open_descriptors();
  { const OpenLogger logger(folder_ / "Log.txt"); }
  EXPECT_EQ(log_text(folder_ / "Log.txt"), opening_banner() + closing_banner());
  EXPECT_TRUE(OpenLogger::m_FileInfoList.empty());
  EXPECT_EQ(open_descriptors(), before);
}

TEST_F(FileLogger, ALoggerInAStaticMayOutliveAllElse) {
  const pid_t child = fork();
  if (child == 0) {
    early_logger.SetFileName((folder_ / "Log.txt").c_str());
    early_logger.OpenFile();
    std::exit(0);  // NOLINT(concurrency-mt-unsafe): the child has one thread
  }
  int status = -1;
  ASSERT_EQ(waitpid(child, &status, 0), child);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(log_text(folder_ / "Log.txt"), opening_banner() + closing_banner());
}

TEST_F(FileLogger, AFileThatCannotBeOpenedLeavesTheLoggerSilent) {
  for (const std::string& name : {folder_ / "gone/Log.txt", folder_.path(), folder_ / std::string(4096, 'n')}) {
    OpenLogger logger;
    stderr_of([&] {
      logger.SetFileName(name.c_str());
      logger.OpenFile();
    });
    EXPECT_EQ(logger.m_FileId, 0);
    EXPECT_EQ(stderr_of([&] {
                logger.Log("nowhere");
                logger.CycleFiles();
                logger.CycleCloseFile();
                logger.CycleOpenFile();
                logger.CloseFile();
              }),
              "");
  }
}

TEST_F(FileLogger, AReadOnlyFileIsNotWritten) {
  ASSERT_EQ(chmod(folder_.path().c_str(), 0755), 0);
  const std::string path = folder_.make_file("Log.txt", "old");
  ASSERT_EQ(chmod(path.c_str(), 0444), 0);
  EXPECT_EQ(in_child([&] {
              if (!become_unprivileged()) return std::string("still privileged");
              OpenLogger logger(path);
              logger.Log("lost");
              return std::to_string(logger.m_FileId);
            }),
            "0");
  EXPECT_EQ(contents_of(path), "old");
}

TEST_F(FileLogger, IgnoresNullText) {
  OpenLogger logger(folder_ / "Log.txt");
  logger.Log(nullptr);
  EXPECT_EQ(log_text(folder_ / "Log.txt"), opening_banner());
}

TEST_F(FileLogger, AFullDeviceIsNoFailure) {
  OpenLogger logger("/dev/full");
  EXPECT_EQ(stderr_of([&] {
              logger.Log("lost");
              logger.Log("lost");
            }),
            "");
}

TEST_F(FileLogger, AShortWriteSkipsTheRotation) {
  const std::string report = in_child([&] {
    std::signal(SIGXFSZ, SIG_IGN);
    OpenLogger logger(folder_ / "Log.txt");
    logger.limit(1, 1);
    const rlimit limit = {1024, 1024};
    if (setrlimit(RLIMIT_FSIZE, &limit) != 0) return std::string("no limit");
    const std::string told = stderr_of([&] {
      logger.Log(text_up_to(1025).c_str());
      logger.Log("lost");
    });
    return told + std::to_string(contents_of(folder_ / "Log.txt").size());
  });
  EXPECT_EQ(report, "1024");
  EXPECT_FALSE(is_there(folder_ / "Log1.txt"));
}

TEST_F(FileLogger, GoesOnWhenTheDiskHasRoomAgain) {
  const std::string report = in_child([&] {
    std::signal(SIGXFSZ, SIG_IGN);
    OpenLogger logger(folder_ / "Log.txt");
    rlimit limit = {};
    getrlimit(RLIMIT_FSIZE, &limit);
    const rlim_t former = limit.rlim_cur;
    limit.rlim_cur = opening_banner().size() + 3;
    if (setrlimit(RLIMIT_FSIZE, &limit) != 0) return std::string("no limit");
    logger.Log("cut off");
    logger.Log("lost");
    limit.rlim_cur = former;
    if (setrlimit(RLIMIT_FSIZE, &limit) != 0) return std::string("no limit");
    logger.Log(" again");
    return log_text(folder_ / "Log.txt");
  });
  EXPECT_EQ(report, opening_banner() + "cut again");
}

TEST_F(FileLogger, IsDestroyedThroughItsBase) {
  CFileLogger* logger = new OpenLogger(folder_ / "Log.txt");
  delete logger;
  EXPECT_EQ(log_text(folder_ / "Log.txt"), opening_banner() + closing_banner());
}

}  // namespace
}  // namespace vexa_test
