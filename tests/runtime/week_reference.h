// SPDX-License-Identifier: Apache-2.0
// Week numbers found by walking and by the C library, to hold the library's arithmetic against.
#pragma once

#include <cstdlib>
#include <ctime>

namespace vexa::test {

struct WalkedDay {
  int year = 1970;
  int month = 1;
  int day = 1;
  int day_of_year = 1;
  int weekday = 4;  // 1970-01-01 was a Thursday

  int month_length() const {
    if (month == 2) return leap() ? 29 : 28;
    return month == 4 || month == 6 || month == 9 || month == 11 ? 30 : 31;
  }
  bool leap() const { return year % 400 == 0 || (year % 4 == 0 && year % 100 != 0); }
  int days_left_in_year() const { return (leap() ? 366 : 365) - day_of_year; }

  void next() {
    weekday = weekday == 6 ? 0 : weekday + 1;
    ++day_of_year;
    if (++day <= month_length()) return;
    day = 1;
    if (++month <= 12) return;
    month = 1;
    day_of_year = 1;
    ++year;
  }
};

struct ReferenceWeek {
  int year;
  int week;
};

inline ReferenceWeek reference_by_days(const WalkedDay& day) {
  int week = 1;
  for (int first = 8; first <= day.day_of_year; first += 7) ++week;
  return {day.year, week};
}

/// Counts the first days of weeks passed since January 1, unless the next January 1 comes before the next of them.
inline ReferenceWeek reference_of_january_first(const WalkedDay& day, int first_day) {
  int days_left = 0;
  for (int weekday = (day.weekday + 1) % 7; weekday != first_day; weekday = (weekday + 1) % 7) ++days_left;
  if (days_left > day.days_left_in_year()) return {day.year + 1, 1};
  int week = 1;
  int weekday = day.weekday;
  for (int left = day.day_of_year; left > 1; --left) {
    if (weekday == first_day) ++week;
    weekday = weekday == 0 ? 6 : weekday - 1;
  }
  return {day.year, week};
}

inline ReferenceWeek reference_by_iso(const WalkedDay& day) {
  std::tm time{};
  time.tm_year = day.year - 1900;
  time.tm_yday = day.day_of_year - 1;
  time.tm_wday = day.weekday;
  char text[16] = {};
  std::strftime(text, sizeof text, "%G %V", &time);
  char* end = nullptr;
  const long year = std::strtol(text, &end, 10);
  return {static_cast<int>(year), static_cast<int>(std::strtol(end, nullptr, 10))};
}

}  // namespace vexa::test
