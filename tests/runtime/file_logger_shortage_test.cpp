// SPDX-License-Identifier: Apache-2.0
// Log files when memory is short.
#include <gtest/gtest.h>

#include <functional>
#include <string>

#include "tests/support/failing_new.h"
#include "tests/support/log_text.h"
#include "tests/support/process_state.h"
#include "tests/support/temporary_folder.h"
#include "vexa/file_logger.h"

namespace vexa_test {
namespace {

class Logger : public CFileLogger {
 public:
  using CFileLogger::m_CopyCount;
  using CFileLogger::m_MaxSize;
};

const char* const kLongName =
    "another-name-that-is-longer-than-a-text-holds-by-itself-and-than-the-folder-of-the-test-"
    "and-the-name-of-the-log-file-in-it-together-so-that-a-text-must-grow-for-it-again";

/// Makes the step with a logger while an allocation of it fails.
void expect_no_descriptor_kept(const std::function<void(Logger&)>& step, bool open, Shortage& shortage) {
  const TemporaryFolder folder;
  const std::string name = folder / "a-name-that-is-longer-than-a-text-holds-by-itself.txt";
  const std::size_t descriptors = open_descriptors();
  {
    Logger logger;
    logger.SetFileName(name.c_str());
    logger.m_MaxSize = 0;
    if (open) logger.OpenFile();
    shortage.run([&] { step(logger); });
  }
  EXPECT_EQ(open_descriptors(), descriptors);
}

TEST(FileLoggerShortOfMemory, ThrowsNothing) {
  const struct {
    const char* name;
    bool open;
    std::function<void(Logger&)> step;
  } rows[] = {
      {"naming", false, [](Logger& logger) { logger.SetFileName(kLongName); }},
      {"opening", false, [](Logger& logger) { logger.OpenFile(); }},
      {"opening again", true, [](Logger& logger) { logger.OpenFile(); }},
      {"a line that rotates", true, [](Logger& logger) { logger.Log("line"); }},
      {"closing", true, [](Logger& logger) { logger.CloseFile(); }},
  };
  for (const auto& row : rows) {
    SCOPED_TRACE(row.name);
    fails_at_every_allocation([&](Shortage& shortage) { expect_no_descriptor_kept(row.step, row.open, shortage); });
  }
}

TEST(FileLoggerShortOfMemory, OpensNoFileOfItsFormerName) {
  const TemporaryFolder folder;
  const std::string former = folder / "log.txt";
  CFileLogger logger;
  logger.SetFileName(former.c_str());
  {
    const AllocationFailure failure(0);
    logger.SetFileName(kLongName);
    EXPECT_TRUE(failure.happened());
  }
  logger.OpenFile();
  logger.Log("line");
  EXPECT_EQ(entries_in(folder.path().c_str()), 0u);
}

TEST(FileLoggerShortOfMemory, LeavesTheBannerOutAtItsEnd) {
  const TemporaryFolder folder;
  const std::string name = folder / "log.txt";
  {
    CFileLogger logger;
    logger.SetFileName(name.c_str());
    logger.OpenFile();
    logger.Log("line");
    const AllocationFailure failure(0);
    logger.CloseFile();
    EXPECT_TRUE(failure.happened());
  }
  const std::string text = contents_of(name);
  EXPECT_NE(text.find("line"), std::string::npos);
  EXPECT_EQ(text.find("Closed"), std::string::npos);
}

}  // namespace
}  // namespace vexa_test
