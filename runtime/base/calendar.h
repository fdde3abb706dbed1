// SPDX-License-Identifier: Apache-2.0
// The Gregorian calendar: days, years and week numbers as plain arithmetic, without zones or clocks.
#pragma once

#include <cstdint>
#include <ctime>
#include <optional>

namespace vexa {

constexpr int kDaysPerWeek = 7;
constexpr int kMonthsPerYear = 12;

bool is_leap_year(int year);

/// Days in month 1 to 12; -1 for any other month.
int days_in_month(int year, int month);

/// The 1-based day of the year; nullopt for a month outside 1 to 12 or a day outside 1 to 31.
std::optional<int> day_of_year(int year, int month, int day);

/// Seconds from 1970-01-01 00:00:00 UTC to a broken-down UTC time, whatever time_t is. Day, hour, minute and second are
/// added as they are; a month before January counts as January, one after December as the whole year.
std::int64_t utc_seconds(const std::tm& time);

/// Sets year, month and day to those of the decimal number YYYYMMDD, whatever day that is.
void set_date(std::tm& time, int date);
/// Sets hour, minute and second to those of the decimal number hhmmss likewise.
void set_clock(std::tm& time, int clock);

/// A day as the week rules see it.
struct WeekDay {
  int year;
  int day;      ///< 0-based day of the year
  int weekday;  ///< 0 (Sunday) to 6
};

/// A week and the year it belongs to.
struct YearWeek {
  int year;
  int week;
  bool operator==(const YearWeek&) const = default;
};

/// How many days ago the week of a day of the week began, 0 to 6. `first_day` counts modulo 7.
int days_into_week(int weekday, int first_day);

/// Week 1 is the first seven days of the year.
YearWeek week_by_days(const WeekDay& day);
/// Week 1 holds January 1; late December days in the week of the next January 1 are in that year's week 1.
YearWeek week_of_january_first(const WeekDay& day, int first_day);
/// ISO 8601.
YearWeek week_by_iso(const WeekDay& day);

}  // namespace vexa
