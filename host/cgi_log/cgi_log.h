// SPDX-License-Identifier: Apache-2.0
// The driver's CGI log, read back: which request got which answer, and when.
#ifndef HOST_CGI_LOG_CGI_LOG_H_
#define HOST_CGI_LOG_CGI_LOG_H_

#include <chrono>
#include <cstddef>
#include <functional>
#include <optional>
#include <string>
#include <string_view>

#include "host/access/redactor.h"
#include "host/base/problem.h"

namespace vexa::host {

using LogTime = std::chrono::local_time<std::chrono::milliseconds>;

struct CgiLogLine {
  enum class Direction { kTo, kFrom };

  LogTime time;
  Direction direction;
  std::string message;  // the path of a request, or the status and reason of an answer
};

// `text` is a line without the line break that begins it. Nullopt when it is not one that the driver writes.
[[nodiscard]] std::optional<CgiLogLine> parse_cgi_log_line(std::string_view text);

struct CgiRequest {
  LogTime time;
  std::string path;
};

struct CgiAnswer {
  LogTime time;
  std::optional<int> status;
  std::string reason;
};

[[nodiscard]] CgiAnswer to_answer(const CgiLogLine& line);

// At least one of the two is there.
struct CgiExchange {
  std::optional<CgiRequest> request;
  std::optional<CgiAnswer> answer;

  // Nullopt without both, and when the clock was put back between them.
  [[nodiscard]] std::optional<std::chrono::milliseconds> duration() const;
};

// Takes a log's bytes in pieces of any size, and passes on each exchange as soon as it is complete. Used by one thread;
// opens no file.
class CgiLogReader {
 public:
  using Take = std::function<void(const CgiExchange&)>;
  // Longer lines are cut, and end in "..."; the driver's own are far shorter.
  static constexpr std::size_t kLongestLine = 8192;

  explicit CgiLogReader(Take take) : take_(std::move(take)) {}

  void feed(std::string_view bytes);
  // A line ends where the next begins, so the last one has no end: this declares it complete.
  void settle();
  // Another file follows, whose answers may be those to the requests of this one.
  void begin_file();
  // The log ends: a request that still waits has got no answer.
  void finish();

  [[nodiscard]] std::size_t lines() const { return lines_; }
  [[nodiscard]] std::size_t foreign_lines() const { return foreign_lines_; }
  [[nodiscard]] bool saw_banner() const { return saw_banner_; }

 private:
  void keep(char c);
  void end_line();
  void read_line();
  void take_line(CgiLogLine line);

  const Take take_;
  std::string line_;
  bool after_return_ = false;
  bool settled_ = false;  // what follows up to the next line break belongs to a line already read
  std::optional<CgiRequest> waiting_;
  std::size_t lines_ = 0;
  std::size_t foreign_lines_ = 0;
  bool saw_banner_ = false;
};

[[nodiscard]] std::string table_head();
// One line, with its end. The camera's own words come last, so that they can pass for no other column.
[[nodiscard]] std::string table_row(const CgiExchange& exchange, const Redactor& redactor);
// One line of JSON, with its end; null for what is missing. It is in ASCII, all control characters escaped.
[[nodiscard]] std::string json_row(const CgiExchange& exchange, const Redactor& redactor);

// The driver does not report a log that it cannot write, so this does. Creates the file.
[[nodiscard]] std::optional<Problem> check_cgi_log_target(const std::string& path);

}  // namespace vexa::host

#endif  // HOST_CGI_LOG_CGI_LOG_H_
