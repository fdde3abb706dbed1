// SPDX-License-Identifier: Apache-2.0
// vexactl log: the driver's CGI log as a table.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <array>

#include "host/access/credentials.h"
#include "host/cgi_log/cgi_log.h"
#include "host/cgi_log/followed_file.h"
#include "host/commands/command.h"
#include "host/console/interrupt.h"
#include "host/console/terminal.h"

namespace vexa::host {
namespace {

constexpr std::chrono::milliseconds kPause{100};

struct LogOptions {
  std::string path;
  bool follow = false;
  bool json = false;
};

// The only password that could be known here is the environment's.
Redactor redactor_of(const char* const* environment) {
  CredentialSources sources;
  read_environment(sources, environment);
  return Redactor({sources.environment_user.value_or(""), sources.environment_password.value_or("")});
}

class LogView {
 public:
  LogView(const LogOptions& options, const Redactor& redactor, Terminal& terminal)
      : options_(options), redactor_(redactor), terminal_(terminal), file_(options.path) {}

  ExitCode run() {
    if (const auto problem = open()) return terminal_.report(*problem);
    if (options_.follow) Interrupt::finish_orderly();
    const ExitCode code = options_.follow ? follow() : read_to_end();
    if (code != ExitCode::kOk) return code;
    reader_.finish();
    const ExitCode written = write_rows();
    if (written != ExitCode::kOk) return written;
    return options_.follow ? ExitCode::kInterrupted : conclude();
  }

 private:
  [[nodiscard]] std::optional<Problem> open() {
    if (auto problem = file_.open()) return problem;
    if (!options_.follow || file_.is_regular()) return std::nullopt;
    return Problem{ExitCode::kUsage, fmt::format("{} is not a regular file", options_.path),
                   "--follow needs one; leave it out to read this once."};
  }

  ExitCode follow() {
    while (!Interrupt::requested()) {
      if (const auto problem = check_reader(terminal_)) return terminal_.report(*problem);
      const std::size_t before = bytes_;
      const ExitCode code = read_to_end();
      if (code != ExitCode::kOk) return code;
      if (file_.begin_successor()) {
        reader_.begin_file();
        continue;
      }
      // A line still being written has grown since the previous read.
      if (bytes_ == before) reader_.settle();
      const ExitCode written = write_rows();
      if (written != ExitCode::kOk) return written;
      Interrupt::wait(kPause);
    }
    return ExitCode::kOk;
  }

  ExitCode read_to_end() {
    while (!Interrupt::requested()) {
      const Result<std::size_t> length = file_.read(piece_);
      if (!length) return terminal_.report(length.error());
      if (*length == 0) break;
      bytes_ += *length;
      reader_.feed({piece_.data(), *length});
      const ExitCode written = write_rows();
      if (written != ExitCode::kOk) return written;
    }
    return ExitCode::kOk;
  }

  void add_row(const CgiExchange& exchange) {
    if (options_.json) {
      rows_ += json_row(exchange, redactor_);
      return;
    }
    if (!std::exchange(has_head_, true)) rows_ += table_head();
    rows_ += table_row(exchange, redactor_);
  }

  ExitCode write_rows() {
    if (rows_.empty()) return ExitCode::kOk;
    return write_result(terminal_, std::exchange(rows_, {}));
  }

  ExitCode conclude() {
    const std::string& path = options_.path;
    if (reader_.lines() == 0 && !reader_.saw_banner()) {
      return terminal_.report(
          {ExitCode::kUsage, bytes_ == 0 ? fmt::format("{} is empty", path) : fmt::format("{} is not a CGI log", path),
           "The other commands write one with --cgi-log FILE."});
    }
    if (reader_.foreign_lines() > 0) {
      terminal_.say(
          fmt::format("vexactl: skipped lines that are not of a CGI log: {} in {}", reader_.foreign_lines(), path));
    }
    if (reader_.lines() == 0) terminal_.say(fmt::format("vexactl: {} holds no request", path));
    return ExitCode::kOk;
  }

  const LogOptions& options_;
  const Redactor& redactor_;
  Terminal& terminal_;
  FollowedFile file_;
  std::array<char, 65536> piece_{};
  std::size_t bytes_ = 0;
  std::string rows_;
  bool has_head_ = false;
  CgiLogReader reader_{[this](const CgiExchange& exchange) { add_row(exchange); }};
};

class LogCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    CLI::App* command = program.add_subcommand("log", "Show the requests and answers that --cgi-log has written");
    redactor_ = redactor_of(environment);
    command->add_option("file", options_.path, "the log")->required()->type_name("");
    command->add_flag("--follow", options_.follow, "keep reading what is appended, also after rotation, until Ctrl-C");
    command->add_flag("--json", options_.json, "print a line of JSON for each request");
    command->footer(
        "Times are local. An answer belongs to the request before it; a request followed by another got no answer.\n"
        "The password in VEXACTL_PASSWORD is hidden, should a camera have sent it back.");
    return command;
  }

  ExitCode run(Terminal& terminal) override { return LogView(options_, redactor_, terminal).run(); }

 private:
  LogOptions options_;
  Redactor redactor_;
};

}  // namespace

std::unique_ptr<Command> make_log_command() { return std::make_unique<LogCommand>(); }

}  // namespace vexa::host
