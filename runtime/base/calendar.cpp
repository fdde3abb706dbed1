// SPDX-License-Identifier: Apache-2.0
#include "runtime/base/calendar.h"

#include <algorithm>
#include <array>

namespace vexa {
namespace {

constexpr std::array kDaysBeforeMonth = {0, 31, 59, 90, 120, 151, 181, 212, 243, 273, 304, 334};
constexpr std::array kDaysInMonth = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
static_assert(kDaysBeforeMonth.size() == kMonthsPerYear && kDaysInMonth.size() == kMonthsPerYear);

constexpr std::int64_t kDaysPer400Years = 146097;
constexpr std::int64_t kDaysPer100Years = 36524;
constexpr std::int64_t kDaysPer4Years = 1461;
constexpr std::int64_t kDaysPerYear = 365;
constexpr std::int64_t kEpochDay = 719163;  // 1970-01-01, when 0001-01-01 is day 1

constexpr int kThursday = 4;
constexpr int kMonday = 1;

int days_in_year(int year) { return is_leap_year(year) ? 366 : 365; }

/// Days of all years from 1 up to, not including, `year`; negative for years before 1.
std::int64_t days_before_year(std::int64_t year) {
  std::int64_t years = year - 1;
  std::int64_t cycles = years / 400;
  years %= 400;
  if (years < 0) {
    years += 400;
    --cycles;
  }
  const std::int64_t centuries = years / 100;
  years %= 100;
  return cycles * kDaysPer400Years + centuries * kDaysPer100Years + years / 4 * kDaysPer4Years +
         years % 4 * kDaysPerYear;
}

}  // namespace

bool is_leap_year(int year) { return (year % 4 == 0 && year % 100 != 0) || year % 400 == 0; }

int days_in_month(int year, int month) {
  if (month < 1 || month > kMonthsPerYear) return -1;
  if (month == 2 && is_leap_year(year)) return 29;
  return kDaysInMonth[static_cast<std::size_t>(month - 1)];
}

std::optional<int> day_of_year(int year, int month, int day) {
  if (month < 1 || month > kMonthsPerYear || day < 1 || day > 31) return std::nullopt;
  const int leap_day = month > 2 && is_leap_year(year) ? 1 : 0;
  return kDaysBeforeMonth[static_cast<std::size_t>(month - 1)] + leap_day + day;
}

std::int64_t utc_seconds(const std::tm& time) {
  const std::int64_t year = std::int64_t{time.tm_year} + 1900;
  const int year_in_cycle = static_cast<int>(year % 400);
  std::int64_t days = time.tm_mday - kEpochDay + days_before_year(year);
  // Safe: a camera's date may name month 99; the months before it end with the table.
  const int months_before = std::min(time.tm_mon, kMonthsPerYear);
  for (int month = 1; month <= months_before; ++month) days += days_in_month(year_in_cycle, month);
  return days * 86400 + std::int64_t{time.tm_hour} * 3600 + std::int64_t{time.tm_min} * 60 + time.tm_sec;
}

void set_date(std::tm& time, int date) {
  time.tm_year = date / 10000 - 1900;
  time.tm_mon = date / 100 % 100 - 1;
  time.tm_mday = date % 100;
}

void set_clock(std::tm& time, int clock) {
  time.tm_hour = clock / 10000;
  time.tm_min = clock / 100 % 100;
  time.tm_sec = clock % 100;
}

int days_into_week(int weekday, int first_day) {
  const int days = (weekday - first_day % kDaysPerWeek) % kDaysPerWeek;
  return days < 0 ? days + kDaysPerWeek : days;
}

YearWeek week_by_days(const WeekDay& day) { return {day.year, day.day / kDaysPerWeek + 1}; }

YearWeek week_of_january_first(const WeekDay& day, int first_day) {
  const int week_begin = day.day - days_into_week(day.weekday, first_day);
  if (week_begin + kDaysPerWeek > days_in_year(day.year)) return {day.year + 1, 1};
  // A week that began in the year before is week 1; -6 .. 0 become 0 .. 6 here.
  return {day.year, (week_begin + kDaysPerWeek - 1) / kDaysPerWeek + 1};
}

YearWeek week_by_iso(const WeekDay& day) {
  // A week belongs to the year of its Thursday, and its number is how many Thursdays that year has had.
  const int thursday = day.day - days_into_week(day.weekday, kMonday) + kThursday - kMonday;
  if (thursday < 0) return {day.year - 1, (thursday + days_in_year(day.year - 1)) / kDaysPerWeek + 1};
  if (thursday >= days_in_year(day.year)) return {day.year + 1, 1};
  return {day.year, thursday / kDaysPerWeek + 1};
}

}  // namespace vexa
