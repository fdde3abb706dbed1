// SPDX-License-Identifier: Apache-2.0
// The output of vexactl: results on standard output, everything else on standard error.
#ifndef HOST_CONSOLE_TERMINAL_H_
#define HOST_CONSOLE_TERMINAL_H_

#include <mutex>
#include <optional>
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
  // Whether a person reads the results, so that tables have headings.
  [[nodiscard]] bool results_on_terminal() const { return results_on_terminal_; }
  // Whether nobody reads the results any more: a pipe's other end is closed. A command that waits asks now and then,
  // since only a write would find out otherwise.
  [[nodiscard]] bool reader_gone() const;
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
  bool results_on_terminal_;
  bool shows_progress_;
  std::mutex mutex_;
  std::string progress_;
};

// Writes it to standard output; reports a failure and returns its exit code.
[[nodiscard]] ExitCode write_result(Terminal& terminal, std::string_view text);

// A table's rows; on a terminal its heading above them. Scripts read rows alone.
[[nodiscard]] ExitCode write_table(Terminal& terminal, std::string_view heading, std::string_view rows);

// The problem of results that nobody reads any more, as a write would meet it.
[[nodiscard]] std::optional<Problem> check_reader(const Terminal& terminal);

}  // namespace vexa::host

#endif  // HOST_CONSOLE_TERMINAL_H_
