// SPDX-License-Identifier: Apache-2.0
// The output of vexactl: results on standard output, everything else on standard error.
#ifndef HOST_CONSOLE_TERMINAL_H_
#define HOST_CONSOLE_TERMINAL_H_

#include <mutex>
#include <string>
#include <string_view>

#include "host/base/problem.h"
#include "host/base/unique_fd.h"

namespace vexa::host {

// One a process, made by main(). Thread-safe, because the driver's trace arrives on a thread of its own. Never prints a
// result on standard error.
class Terminal {
 public:
  // Results go to `results`, which the terminal owns. Progress is shown when standard error is a terminal.
  explicit Terminal(UniqueFd results);
  ~Terminal();
  Terminal(const Terminal&) = delete;
  Terminal& operator=(const Terminal&) = delete;

  [[nodiscard]] int results() const { return results_.get(); }
  // Returns 0, or the error's number.
  [[nodiscard]] int write_result(std::string_view text);

  // A whole line on standard error, above the progress line.
  void say(std::string_view line);
  // The problem, and below it what to do; returns its exit code.
  ExitCode report(const Problem& problem);

  [[nodiscard]] bool shows_progress() const { return shows_progress_; }
  void silence_progress() { shows_progress_ = false; }
  // Replaces the progress line; has no effect without a terminal.
  void progress(std::string_view line);
  void clear_progress();

 private:
  void erase_progress_locked();

  UniqueFd results_;
  bool shows_progress_;
  std::mutex mutex_;
  std::string progress_;
};

// Writes it to standard output; reports a failure and returns its exit code.
[[nodiscard]] ExitCode write_result(Terminal& terminal, std::string_view text);

}  // namespace vexa::host

#endif  // HOST_CONSOLE_TERMINAL_H_
