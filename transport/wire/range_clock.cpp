#include "transport/wire/range_clock.h"

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
