// SPDX-License-Identifier: Apache-2.0
#include "host/cgi_log/cgi_log.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <nlohmann/json.hpp>
#include <system_error>
#include <utility>

#include "host/base/number_text.h"
#include "host/base/printable.h"
#include "host/base/unique_fd.h"

namespace vexa::host {
namespace {

using Direction = CgiLogLine::Direction;

// "0" is any digit.
constexpr std::string_view kStamp = "00-00-0000\t00:00:00.000\tCGI\t";
constexpr std::string_view kBannerStamp = "\n00-00-0000 00:00:00.000";
constexpr std::string_view kTo = "To\t";
constexpr std::string_view kFrom = "From\t";
constexpr std::string_view kClosed = "\tLogFile Closed\n";
constexpr std::size_t kRuleLength = 103;

bool is_digit(char c) { return c >= '0' && c <= '9'; }

bool begins_like(std::string_view text, std::string_view pattern) {
  return text.size() >= pattern.size() &&
         std::equal(pattern.begin(), pattern.end(), text.begin(),
                    [](char wanted, char c) { return wanted == '0' ? is_digit(c) : c == wanted; });
}

int number(std::string_view digits) {
  int value = 0;
  for (const char c : digits) value = value * 10 + (c - '0');
  return value;
}

// `stamp` begins like kStamp.
std::optional<LogTime> time_of(std::string_view stamp) {
  using namespace std::chrono;
  const year_month_day date{year{number(stamp.substr(6, 4))}, month{static_cast<unsigned>(number(stamp.substr(3, 2)))},
                            day{static_cast<unsigned>(number(stamp.substr(0, 2)))}};
  const hours hour{number(stamp.substr(11, 2))};
  const minutes minute{number(stamp.substr(14, 2))};
  const seconds second{number(stamp.substr(17, 2))};
  if (!date.ok() || hour >= days{1} || minute >= hours{1} || second >= minutes{1}) return std::nullopt;
  return local_days{date} + hour + minute + second + milliseconds{number(stamp.substr(20, 3))};
}

// A banner begins with a line feed alone, which no message holds: an answer's reason ends at one.
bool is_banner(std::string_view text) {
  if (text.starts_with("\n" + std::string(kRuleLength, '-'))) return true;
  return begins_like(text, kBannerStamp) && text.substr(kBannerStamp.size()).starts_with(kClosed);
}

using Json = nlohmann::ordered_json;

struct Cells {
  std::string_view time;
  std::string_view duration;
  std::string_view status;
  std::string_view request;
  std::string_view answer;
};

constexpr std::string_view kNone = "-";

std::string to_line(const Cells& cells) {
  return fmt::format("{:<23}  {:>6}  {:>6}  {:<40}  {}\n", cells.time, cells.duration, cells.status, cells.request,
                     cells.answer);
}

std::string to_text(LogTime time, char separator) {
  using namespace std::chrono;
  const auto midnight = floor<days>(time);
  const year_month_day date{midnight};
  const hh_mm_ss clock{time - midnight};
  return fmt::format("{:04}-{:02}-{:02}{}{:02}:{:02}:{:02}.{:03}", static_cast<int>(date.year()),
                     static_cast<unsigned>(date.month()), static_cast<unsigned>(date.day()), separator,
                     clock.hours().count(), clock.minutes().count(), clock.seconds().count(),
                     clock.subseconds().count());
}

LogTime time_of(const CgiExchange& exchange) {
  return exchange.request ? exchange.request->time : exchange.answer->time;
}

// The driver would cut a longer name, and write to another file.
constexpr std::size_t kLongestPath = 1023;

Problem unwritable(const std::string& path, const std::string& why) {
  return {ExitCode::kCannotWrite, fmt::format("cannot write {}: {}", path, why),
          "Give --cgi-log a file in a folder that exists and that you may write to."};
}

}  // namespace

std::optional<CgiLogLine> parse_cgi_log_line(std::string_view text) {
  if (!begins_like(text, kStamp)) return std::nullopt;
  const auto time = time_of(text);
  if (!time) return std::nullopt;
  const std::string_view rest = text.substr(kStamp.size());
  if (rest.starts_with(kTo)) return CgiLogLine{*time, Direction::kTo, std::string(rest.substr(kTo.size()))};
  if (rest.starts_with(kFrom)) return CgiLogLine{*time, Direction::kFrom, std::string(rest.substr(kFrom.size()))};
  return std::nullopt;
}

CgiAnswer to_answer(const CgiLogLine& line) {
  std::string_view rest = line.message;
  const std::optional<int> status = take_number<int>(rest);
  if (!status || !(rest.empty() || rest.front() == ' ')) return {line.time, std::nullopt, line.message};
  if (!rest.empty()) rest.remove_prefix(1);
  return {line.time, status, std::string(rest)};
}

std::optional<std::chrono::milliseconds> CgiExchange::duration() const {
  if (!request || !answer || answer->time < request->time) return std::nullopt;
  return answer->time - request->time;
}

void CgiLogReader::feed(std::string_view bytes) {
  for (const char c : bytes) {
    if (c == '\n' && after_return_) {
      end_line();
    } else {
      keep(c);
    }
    after_return_ = c == '\r';
  }
}

void CgiLogReader::keep(char c) {
  // One character more than is shown marks a longer line.
  if (!settled_ && line_.size() <= kLongestLine) line_ += c;
}

void CgiLogReader::end_line() {
  if (line_.ends_with('\r')) line_.pop_back();
  read_line();
  settled_ = false;
}

void CgiLogReader::settle() {
  if (line_.empty()) return;
  read_line();
  settled_ = true;
}

void CgiLogReader::begin_file() {
  settle();
  settled_ = false;
  after_return_ = false;
}

void CgiLogReader::finish() {
  settle();
  if (waiting_) take_({std::exchange(waiting_, std::nullopt), std::nullopt});
}

void CgiLogReader::read_line() {
  std::string text = std::exchange(line_, {});
  const bool cut = text.size() > kLongestLine;
  if (cut) text.resize(kLongestLine);
  const std::size_t end = std::min(text.find('\n'), text.size());
  const std::string_view banner = std::string_view(text).substr(end);
  if (is_banner(banner)) {
    saw_banner_ = true;
  } else if (!banner.empty()) {
    ++foreign_lines_;
  }
  if (end == 0) return;
  auto line = parse_cgi_log_line(std::string_view(text).substr(0, end));
  if (!line) {
    ++foreign_lines_;
    return;
  }
  if (cut) line->message += "...";
  take_line(std::move(*line));
}

void CgiLogReader::take_line(CgiLogLine line) {
  ++lines_;
  if (line.direction == Direction::kFrom) {
    take_({std::exchange(waiting_, std::nullopt), to_answer(line)});
    return;
  }
  if (waiting_) take_({std::exchange(waiting_, std::nullopt), std::nullopt});
  waiting_ = CgiRequest{line.time, std::move(line.message)};
}

std::string table_head() {
  return to_line({.time = "Time", .duration = "ms", .status = "Status", .request = "Request", .answer = "Answer"});
}

std::string table_row(const CgiExchange& exchange, const Redactor& redactor) {
  const auto& [request, answer] = exchange;
  const auto duration = exchange.duration();
  const std::string time = to_text(time_of(exchange), ' ');
  const std::string milliseconds(duration ? fmt::format("{}", duration->count()) : kNone);
  const std::string status(answer && answer->status ? fmt::format("{}", *answer->status) : kNone);
  const std::string path(request ? printable(redactor(request->path)) : kNone);
  const std::string reason = answer ? printable(redactor(answer->reason)) : "no answer";
  return to_line({.time = time, .duration = milliseconds, .status = status, .request = path, .answer = reason});
}

std::string json_row(const CgiExchange& exchange, const Redactor& redactor) {
  const auto& [request, answer] = exchange;
  const auto duration = exchange.duration();
  Json json;
  json["time"] = to_text(time_of(exchange), 'T');
  json["path"] = request ? Json(redactor(request->path)) : Json(nullptr);
  json["status"] = answer && answer->status ? Json(*answer->status) : Json(nullptr);
  json["reason"] = answer ? Json(redactor(answer->reason)) : Json(nullptr);
  json["milliseconds"] = duration ? Json(duration->count()) : Json(nullptr);
  return json.dump(-1, ' ', true, Json::error_handler_t::replace) + "\n";
}

std::optional<Problem> check_cgi_log_target(const std::string& path) {
  if (path.empty()) return Problem{ExitCode::kUsage, "--cgi-log names no file", "For instance: --cgi-log cgi.log."};
  if (path.size() > kLongestPath) {
    return Problem{ExitCode::kUsage, fmt::format("the name of --cgi-log is longer than {} characters", kLongestPath),
                   "Choose a shorter one."};
  }
  // Opening a pipe without a reader must not wait for one.
  const UniqueFd file(open(path.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_NONBLOCK | O_CLOEXEC, 0666));
  if (!file.valid()) return unwritable(path, std::generic_category().message(errno));
  struct stat status {};
  if (fstat(file.get(), &status) != 0) return unwritable(path, std::generic_category().message(errno));
  if (!S_ISREG(status.st_mode)) return unwritable(path, "not a regular file");
  return std::nullopt;
}

}  // namespace vexa::host
