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

/// Lets each allocation of the step fail in turn: how many there are.
int failures_of(const std::function<void(Logger&)>& step, bool open) {
  for (int nth = 0; nth < 1000; ++nth) {
    const TemporaryFolder folder;
    const std::string name = folder / "a-name-that-is-longer-than-a-text-holds-by-itself.txt";
    const std::size_t descriptors = open_descriptors();
    bool happened = false;
    {
      Logger logger;
      logger.SetFileName(name.c_str());
      logger.m_MaxSize = 0;
      if (open) logger.OpenFile();
      const AllocationFailure failure(nth);
      step(logger);
      happened = failure.happened();
    }
    EXPECT_EQ(open_descriptors(), descriptors) << nth;
    if (!happened) return nth;
  }
  return 1000;
}

TEST(FileLoggerShortOfMemory, ThrowsNothing) {
  const struct {
    const char* name;
    bool open;
    std::function<void(Logger&)> step;
  } rows[] = {
      {"naming", false, [](Logger& logger) { logger.SetFileName("another-name-longer-than-a-text-holds-by-itself"); }},
      {"opening", false, [](Logger& logger) { logger.OpenFile(); }},
      {"opening again", true, [](Logger& logger) { logger.OpenFile(); }},
      {"a line that rotates", true, [](Logger& logger) { logger.Log("line"); }},
      {"closing", true, [](Logger& logger) { logger.CloseFile(); }},
  };
  for (const auto& row : rows) {
    const int failures = failures_of(row.step, row.open);
    EXPECT_GT(failures, 0) << row.name;
    EXPECT_LT(failures, 1000) << row.name;
  }
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
