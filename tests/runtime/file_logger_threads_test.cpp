// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <cstdio>
#include <memory>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include "tests/support/log_text.h"
#include "tests/support/temporary_folder.h"
#include "vexa/file_logger.h"

namespace vexa_test {
namespace {

constexpr int kThreads = 16;
constexpr int kLoggers = 4;
constexpr int kLines = 200000;
constexpr int kRotationKilobytes = 64;

class SharedLogger : public CFileLogger {
 public:
  SharedLogger(const std::string& name, int kilobytes, int copies) {
    m_MaxSize = kilobytes;
    m_CopyCount = copies;
    SetFileName(name.c_str());
    OpenFile();
  }
};

std::string line_of(int thread, int number) {
  char line[64];
  std::snprintf(line, sizeof line, "\nthread %02d line %06d end", thread, number);
  return line;
}

/// Logs `lines` lines, as many from each thread, through `kLoggers` loggers of one file.
void log_all(const std::string& path, int copies, int lines) {
  std::vector<std::unique_ptr<SharedLogger>> loggers;
  for (int i = 0; i < kLoggers; ++i)
    loggers.push_back(std::make_unique<SharedLogger>(path, kRotationKilobytes, copies));
  std::vector<std::thread> threads;
  for (int thread = 0; thread < kThreads; ++thread) {
    threads.emplace_back([thread, lines, logger = loggers[static_cast<std::size_t>(thread % kLoggers)].get()] {
      for (int number = 0; number < lines / kThreads; ++number) logger->Log(line_of(thread, number).c_str());
    });
  }
  for (std::thread& thread : threads) thread.join();
}

/// Everything kept, the oldest copy first.
std::string kept_text(const TemporaryFolder& folder, int copies) {
  std::string text;
  for (int copy = copies; copy >= 1; --copy) text += contents_of(folder / ("Log" + std::to_string(copy) + ".txt"));
  return text + contents_of(folder / "Log.txt");
}

/// The number of each thread's next line, -1 before its first; -2 once a line was torn, doubled or out of order.
class LineCheck {
 public:
  explicit LineCheck(std::string_view text) {
    while (!text.empty()) {
      const std::string_view line = text.substr(0, text.find('\n'));
      text.remove_prefix(std::min(line.size() + 1, text.size()));
      check(line);
    }
  }

  int lines() const { return lines_; }
  const std::string& fault() const { return fault_; }
  int first_of(int thread) const { return first_[thread]; }
  int behind_last_of(int thread) const { return next_[thread]; }

 private:
  void check(std::string_view line) {
    int thread = -1;
    int number = -1;
    if (std::sscanf(std::string(line).c_str(), "thread %2d line %6d", &thread, &number) != 2) {
      if (!is_banner(line)) fault_ = "torn: " + std::string(line);
      return;
    }
    ++lines_;
    if (thread < 0 || thread >= kThreads || line_of(thread, number) != "\n" + std::string(line)) {
      fault_ = "torn: " + std::string(line);
    } else if (next_[thread] != -1 && next_[thread] != number) {
      fault_ = "lost or doubled before: " + std::string(line);
    } else {
      if (next_[thread] == -1) first_[thread] = number;
      next_[thread] = number + 1;
    }
  }

  static bool is_banner(std::string_view line) {
    return line.empty() || line == banner_rule() || line.ends_with(" LogFile Opened. ") ||
           line.ends_with("\tLogFile Closed");
  }

  int lines_ = 0;
  std::string fault_;
  int first_[kThreads] = {};
  std::vector<int> next_ = std::vector<int>(kThreads, -1);
};

TEST(FileLoggerThreads, NoLineIsLostTornOrDoubledOverRotations) {
  const TemporaryFolder folder(memory_folder());
  constexpr int kEnoughCopies = 200;
  log_all(folder / "Log.txt", kEnoughCopies, kLines);
  const LineCheck check(kept_text(folder, kEnoughCopies));
  EXPECT_EQ(check.fault(), "");
  EXPECT_EQ(check.lines(), kLines);
  for (int thread = 0; thread < kThreads; ++thread) {
    EXPECT_EQ(check.first_of(thread), 0);
    EXPECT_EQ(check.behind_last_of(thread), kLines / kThreads);
  }
}

TEST(FileLoggerThreads, TheCopiesKeptHoldTheLatestLinesWithoutAGap) {
  const TemporaryFolder folder(memory_folder());
  constexpr int kFewCopies = 3;
  log_all(folder / "Log.txt", kFewCopies, kLines / 4);
  const LineCheck check(kept_text(folder, kFewCopies));
  EXPECT_EQ(check.fault(), "");
  EXPECT_GE(check.lines(), kFewCopies * kRotationKilobytes * 1024 / 40);
  EXPECT_EQ(contents_of(folder / "Log4.txt"), "");
}

TEST(FileLoggerThreads, AReopeningLosesNoLineAndLeavesNoShareBehind) {
  const TemporaryFolder folder(memory_folder());
  constexpr int kWriters = 4;
  constexpr int kLinesEach = 2000;
  SharedLogger logger(folder / "a", 0, 0);
  std::atomic<int> writing{kWriters};
  std::vector<std::thread> threads;
  for (int thread = 0; thread < kWriters; ++thread) {
    threads.emplace_back([thread, &logger, &writing] {
      for (int number = 0; number < kLinesEach; ++number) logger.Log(line_of(thread, number).c_str());
      --writing;
    });
  }
  for (const char* other : {"b", "a"}) {
    threads.emplace_back([&folder, &logger, &writing, other] {
      while (writing > 0) {
        logger.SetFileName((folder / other).c_str());
        logger.OpenFile();
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
  logger.CloseFile();
  int lines = 0;
  for (const char* name : {"a", "b"}) {
    const std::string text = contents_of(folder / name);
    for (std::size_t at = 0; (at = text.find(" end", at)) != std::string::npos; ++at) ++lines;
    EXPECT_TRUE(text.empty() || text.ends_with(banner_rule() + "\n")) << name;
  }
  EXPECT_EQ(lines, kWriters * kLinesEach);
}

}  // namespace
}  // namespace vexa_test
