// SPDX-License-Identifier: Apache-2.0
#include "transport/wire/rtsp_answer.h"

#include <ctime>
#include <string>

#include "runtime/base/calendar.h"
#include "runtime/base/text.h"

namespace vexa {
namespace {

constexpr std::size_t kLongestNumber = 63;
constexpr std::size_t kMicrosDigits = 6;

int number_in(std::string_view digits) { return leading_int(std::string(digits.substr(0, kLongestNumber))); }

int micros_in(std::string_view digits) {
  int micros = number_in(digits);
  // Kept: a fraction of more than six digits is taken as it is; no camera known sends one.
  for (std::size_t length = digits.size(); length < kMicrosDigits; ++length) micros *= 10;
  return micros;
}

}  // namespace

bool rtsp_header_complete(std::string_view looked_at, std::size_t latest) {
  constexpr std::string_view kEnd = "\r\n\r\n";
  const std::size_t begin = latest < kEnd.size() ? latest : latest - kEnd.size();
  if (looked_at.find(kEnd, begin) != std::string_view::npos) return true;
  return looked_at.substr(0, looked_at.size() - latest).ends_with(kEnd);
}

RtpClock rtp_clock(std::string_view answer) {
  using Found = RtpClock::Found;
  // Kept: the first rtpmap line counts, whatever its track; cameras describe their video first.
  const auto rtpmap = text_after(before_nul(answer), "rtpmap:");
  if (!rtpmap) return {Found::kNoRtpmap, 0};
  auto rate_text = text_after(*rtpmap, "/");
  if (!rate_text) return {Found::kNoSlash, 0};
  const auto rate = take_int(*rate_text);
  return rate ? RtpClock{Found::kRate, *rate} : RtpClock{Found::kNoNumber, 0};
}

std::optional<std::string_view> range_clock_text(std::string_view answer) {
  return text_after(before_nul(answer), "clock=");
}

std::optional<int> session_number(std::string_view answer) {
  auto session = text_after(before_nul(answer), "Session:");
  return session ? take_int(*session) : std::nullopt;
}

RangeClock parse_range_clock(std::string_view text) {
  const std::string_view clock = before_nul(text);
  RangeClock read;
  std::tm time{};
  std::size_t time_begin = 0;
  std::size_t field_begin = 0;
  for (std::size_t at = 0; at < clock.size(); ++at) {
    switch (clock[at]) {
      case 'T':
        set_date(time, number_in(clock.substr(0, at)));
        time_begin = field_begin = at + 1;
        break;
      case '.':
        set_clock(time, number_in(clock.substr(time_begin, at - time_begin)));
        read.seconds = utc_seconds(time);
        field_begin = at + 1;
        break;
      case 'z':
      case 'Z':
      case '\n':
      case '\r':
        // Kept: without a "." the seconds are not set, and the time of day is read as the fraction.
        read.micros = micros_in(clock.substr(field_begin, at - field_begin));
        read.understood = true;
        return read;
      default:
        break;
    }
  }
  return read;
}

}  // namespace vexa
