#include "host/cgi_log/cgi_log.h"

#include <algorithm>
#include <utility>

#include "host/base/number_text.h"

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

}  // namespace vexa::host
