// SPDX-License-Identifier: Apache-2.0
// A line of the log beside what the system takes for the same write, in a folder held in memory. The difference between
// the first two is the logger's own cost.
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <string>
#include <string_view>

#include "tests/support/temporary_folder.h"
#include "vexa/file_logger.h"
#include "vexa/real_time.h"
#include "vexa/runtime.h"

namespace {

constexpr std::string_view kLine =
    "\r\n01-02-2024\t12:34:56.789\tCGI\tTo\t/command/inquiry.cgi?inq=camera&inq=system&inq=network";

/// A logger without a limit.
class EndlessLogger : public CFileLogger {
 public:
  explicit EndlessLogger(const std::string& name) {
    m_MaxSize = 0x7FFFFFFF;
    SetFileName(name.c_str());
    OpenFile();
  }
};

void logged_line(benchmark::State& state) {
  const vexa_test::TemporaryFolder folder(vexa_test::memory_folder());
  EndlessLogger logger(folder / "Log.txt");
  for (auto _ : state) logger.Log(kLine.data());
}
BENCHMARK(logged_line);

void write_flush_and_size_alone(benchmark::State& state) {
  const vexa_test::TemporaryFolder folder(vexa_test::memory_folder());
  typedHandle* file = CreateFile((folder / "Log.txt").c_str(), GENERIC_WRITE, 0, nullptr, CREATE_NEW, 0, nullptr);
  for (auto _ : state) {
    unsigned long written = 0;
    WriteFile(file, kLine.data(), kLine.size(), &written, nullptr);
    FlushFileBuffers(file);
    benchmark::DoNotOptimize(GetFileSize(file, nullptr));
  }
  CloseHandle(file);
}
BENCHMARK(write_flush_and_size_alone);

void time_stamp_of_a_line(benchmark::State& state) {
  for (auto _ : state) {
    benchmark::DoNotOptimize(CRealTime::GetTheCurrentTime().Format("\r\n%D-%O-%Y\t%H:%M:%S.%03L\t", false));
  }
}
BENCHMARK(time_stamp_of_a_line);

void line_of_a_logger_without_a_file(benchmark::State& state) {
  CFileLogger logger;
  for (auto _ : state) logger.Log(kLine.data());
}
BENCHMARK(line_of_a_logger_without_a_file);

}  // namespace
