// SPDX-License-Identifier: Apache-2.0
#include "runtime/real_time_format.h"

#include <algorithm>
#include <array>
#include <optional>
#include <string_view>

#include "runtime/base/directive.h"
#include "runtime/file_time.h"

namespace vexa {
namespace {

using MonthNames = std::array<std::string_view, kMonthsPerYear>;
using DayNames = std::array<std::string_view, kDaysPerWeek>;

constexpr DayNames kDayNames = {"Sunday", "Monday", "Tuesday", "Wednesday", "Thursday", "Friday", "Saturday"};
constexpr DayNames kShortDays = {"Sun", "Mon", "Tue", "Wed", "Thu", "Fri", "Sat"};
constexpr MonthNames kMonths = {"January", "February", "March",     "April",   "May",      "June",
                                "July",    "August",   "September", "October", "November", "December"};
constexpr MonthNames kShortMonths = {"Jan", "Feb", "Mar", "Apr", "May", "Jun",
                                     "Jul", "Aug", "Sep", "Oct", "Nov", "Dec"};
constexpr MonthNames kDutchMonths = {"januari", "februari", "maart",     "april",   "mei",      "juni",
                                     "juli",    "augustus", "september", "oktober", "november", "december"};
constexpr MonthNames kShortDutchMonths = {"jan", "feb", "maa", "apr", "mei", "jun",
                                          "jul", "aug", "sep", "okt", "nov", "dec"};
constexpr std::string_view kUnknownShort = "***";

std::string_view day_name(const DayNames& names, int day, std::string_view fallback) {
  return day >= 0 && day < kDaysPerWeek ? names[static_cast<std::size_t>(day)] : fallback;
}

std::string_view month_name(const MonthNames& names, int month, std::string_view fallback) {
  return month >= 1 && month <= kMonthsPerYear ? names[static_cast<std::size_t>(month - 1)] : fallback;
}

std::optional<std::string_view> name_of(char letter, const _SYSTEMTIME& fields) {
  switch (letter) {
    case 'A':
      return day_name(kDayNames, fields.wDayOfWeek, "Unknown");
    case 'a':
      return day_name(kShortDays, fields.wDayOfWeek, kUnknownShort);
    case 'B':
      return month_name(kMonths, fields.wMonth, "Unknown");
    case 'b':
      return month_name(kShortMonths, fields.wMonth, kUnknownShort);
    case 'N':
      return month_name(kDutchMonths, fields.wMonth, "onbekend");
    case 'n':
      return month_name(kShortDutchMonths, fields.wMonth, kUnknownShort);
    default:
      return std::nullopt;
  }
}

// Kept: hundredths are rounded but never carried into the second, so 99 covers 985 to 999 ms.
int hundredths(const _SYSTEMTIME& fields) { return std::min((fields.wMilliseconds + 5) / 10, 99); }

/// The letters of fixed width.
std::optional<std::string> fixed_field(char letter, const TimeParts& parts) {
  switch (letter) {
    case 'Y':
      return four_digits(parts.fields.wYear);
    case 'y':
      return two_digits(parts.fields.wYear % 100);
    case 'O':
      return two_digits(parts.fields.wMonth);
    case 'D':
      return two_digits(parts.fields.wDay);
    case 'H':
      return two_digits(parts.fields.wHour);
    case 'M':
      return two_digits(parts.fields.wMinute);
    case 'S':
      return two_digits(parts.fields.wSecond);
    case 'l':
      return two_digits(hundredths(parts.fields));
    case 'W':
      return two_digits(parts.week.week);
    case 'G':
      return four_digits(parts.week.year);
    case 'g':
      return two_digits(parts.week.year % 100);
    default:
      return std::nullopt;
  }
}

/// The numbers that flags apply to.
std::optional<int> flagged_number(char letter, const TimeParts& parts) {
  switch (letter) {
    case 'o':
      return parts.fields.wMonth;
    case 'd':
      return parts.fields.wDay;
    case 'h':
      return parts.fields.wHour;
    case 'm':
      return parts.fields.wMinute;
    case 's':
      return parts.fields.wSecond;
    case 'L':
      return parts.fields.wMilliseconds;
    case 'w':
      return parts.week.week;
    case 'X':
      return parts.day_of_year;
    case 'x':
      return days_in_month(parts.fields.wYear, parts.fields.wMonth);
    default:
      return std::nullopt;
  }
}

}  // namespace

std::string format_time(const char* format, const TimeParts& parts) {
  return expand_directives(format, [&parts](char letter, const FieldFlags& flags) -> std::optional<std::string> {
    if (const auto name = name_of(letter, parts.fields)) return text_field(*name, flags);
    if (const auto number = flagged_number(letter, parts)) return number_field(*number, flags);
    return fixed_field(letter, parts);
  });
}

}  // namespace vexa
