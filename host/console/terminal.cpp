// SPDX-License-Identifier: Apache-2.0
#include "host/console/terminal.h"

#include <fmt/format.h>
#include <poll.h>
#include <unistd.h>

#include <cerrno>
#include <string>
#include <system_error>

#include "host/base/unique_fd.h"

namespace vexa::host {
namespace {

constexpr std::string_view kEraseLine = "\r\x1b[K";

// A failure of standard error itself cannot be reported.
void write_error_text(std::string_view text) { (void)write_all(STDERR_FILENO, text.data(), text.size()); }

Problem unwritable(int error) {
  return {ExitCode::kCannotWrite,
          fmt::format("cannot write standard output: {}", std::generic_category().message(error)),
          "Check where it is redirected to."};
}

}  // namespace

Terminal::Terminal(UniqueFd results)
    : results_(std::move(results)),
      results_on_terminal_(isatty(results_.get()) == 1),
      shows_progress_(isatty(STDERR_FILENO) == 1) {}

Terminal::~Terminal() { clear_progress(); }

bool Terminal::reader_gone() const {
  pollfd reader{results_.get(), 0, 0};
  return poll(&reader, 1, 0) == 1 && (reader.revents & (POLLERR | POLLHUP)) != 0;
}

int Terminal::write_result(std::string_view text) { return write_all(results_.get(), text.data(), text.size()); }

void Terminal::say(std::string_view line) {
  const std::lock_guard lock(mutex_);
  const std::string restored = progress_;
  erase_progress_locked();
  write_error_text(fmt::format("{}\n{}", line, restored));
  progress_ = restored;
}

ExitCode Terminal::report(const Problem& problem) {
  clear_progress();
  say(fmt::format("vexactl: {}", problem.text));
  if (!problem.advice.empty()) say(fmt::format("  {}", problem.advice));
  return problem.code;
}

void Terminal::progress(std::string_view line) {
  if (!shows_progress_) return;
  const std::lock_guard lock(mutex_);
  erase_progress_locked();
  progress_ = line;
  write_error_text(progress_);
}

void Terminal::clear_progress() {
  const std::lock_guard lock(mutex_);
  erase_progress_locked();
}

void Terminal::erase_progress_locked() {
  if (progress_.empty()) return;
  write_error_text(kEraseLine);
  progress_.clear();
}

ExitCode write_result(Terminal& terminal, std::string_view text) {
  terminal.clear_progress();
  const int error = terminal.write_result(text);
  return error == 0 ? ExitCode::kOk : terminal.report(unwritable(error));
}

ExitCode write_table(Terminal& terminal, std::string_view heading, std::string_view rows) {
  if (!terminal.results_on_terminal()) return write_result(terminal, rows);
  return write_result(terminal, std::string(heading) + std::string(rows));
}

std::optional<Problem> check_reader(const Terminal& terminal) {
  return terminal.reader_gone() ? std::optional(unwritable(EPIPE)) : std::nullopt;
}

}  // namespace vexa::host
