// SPDX-License-Identifier: Apache-2.0
#include "runtime/base/calendar.h"

#include <gtest/gtest.h>

#include <climits>

#include "tests/runtime/in_zone.h"
#include "tests/runtime/week_reference.h"

namespace vexa {
namespace {

using test::WalkedDay;

std::tm tm_of(int year, int month, int day) {
  std::tm time{};
  time.tm_year = year - 1900;
  time.tm_mon = month - 1;
  time.tm_mday = day;
  return time;
}

TEST(Calendar, LeapYearsAreThoseDivisibleByFourButNotByHundredUnlessByFourHundred) {
  const struct {
    int year;
    bool leap;
  } cases[] = {{1600, true},  {1700, false}, {1900, false}, {1996, true}, {1999, false}, {2000, true},
               {2023, false}, {2024, true},  {2100, false}, {2400, true}, {0, true},     {-4, true}};
  for (const auto& c : cases) EXPECT_EQ(is_leap_year(c.year), c.leap) << c.year;
}

TEST(Calendar, EveryMonthHasItsDays) {
  const int days[] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
  for (int month = 1; month <= 12; ++month) EXPECT_EQ(days_in_month(2023, month), days[month - 1]) << month;
  for (int month = 1; month <= 12; ++month) {
    EXPECT_EQ(days_in_month(2024, month), days[month - 1] + (month == 2 ? 1 : 0)) << month;
  }
}

TEST(Calendar, MonthsThatDoNotExistHaveNoDays) {
  for (const int month : {0, 13, -1, INT_MIN, INT_MAX}) EXPECT_EQ(days_in_month(2024, month), -1) << month;
}

TEST(Calendar, FebruaryHas28DaysIn1900And29In2000) {
  EXPECT_EQ(days_in_month(1900, 2), 28);
  EXPECT_EQ(days_in_month(2000, 2), 29);
}

TEST(Calendar, DayOfYearCountsTheMonthsBeforeAndTheLeapDay) {
  const int before[] = {0, 31, 59, 90, 120, 151, 181, 212, 243, 273, 304, 334};
  for (int month = 1; month <= 12; ++month) {
    EXPECT_EQ(day_of_year(2023, month, 1), before[month - 1] + 1) << month;
    EXPECT_EQ(day_of_year(2024, month, 1), before[month - 1] + 1 + (month > 2 ? 1 : 0)) << month;
  }
  EXPECT_EQ(day_of_year(2023, 12, 31), 365);
  EXPECT_EQ(day_of_year(2024, 12, 31), 366);
  EXPECT_EQ(day_of_year(2024, 2, 29), 60);
}

TEST(Calendar, DayOfYearNeedsAMonthFrom1To12AndADayFrom1To31) {
  const struct {
    int month;
    int day;
  } cases[] = {{0, 1}, {13, 1}, {1, 0}, {1, 32}, {-1, 1}, {1, -1}, {INT_MAX, INT_MAX}};
  for (const auto& c : cases) EXPECT_FALSE(day_of_year(2024, c.month, c.day)) << c.month << "/" << c.day;
}

TEST(Calendar, SecondsGrowByADayADayFromYear1To9999) {
  std::int64_t expected = -62135596800;  // 0001-01-01
  WalkedDay day{1, 1, 1, 1, 1};
  for (; day.year <= 9999; day.next(), expected += 86400) {
    ASSERT_EQ(utc_seconds(tm_of(day.year, day.month, day.day)), expected)
        << day.year << "-" << day.month << "-" << day.day;
  }
  EXPECT_EQ(expected, 253402300800);  // 10000-01-01
}

TEST(Calendar, SecondsEqualThoseOfTheCLibraryOnEveryDayItReaches) {
  WalkedDay day{1, 1, 1, 1, 1};
  const int first_year = test::kWideTime ? 1 : 1902;
  const int last_year = test::kWideTime ? 9999 : 2037;
  for (; day.year <= last_year; day.next()) {
    if (day.year < first_year) continue;
    std::tm time = tm_of(day.year, day.month, day.day);
    time.tm_hour = day.day_of_year % 24;
    time.tm_min = day.day_of_year % 60;
    time.tm_sec = (day.day_of_year + day.weekday) % 60;
    const std::int64_t seconds = utc_seconds(time);
    ASSERT_EQ(seconds, timegm(&time)) << day.year << "-" << day.month << "-" << day.day;
  }
}

TEST(Calendar, SecondsCountFrom1970) {
  EXPECT_EQ(utc_seconds(tm_of(1970, 1, 1)), 0);
  EXPECT_EQ(utc_seconds(tm_of(2038, 1, 20)), 2147558400);
  std::tm time = tm_of(2024, 2, 29);
  time.tm_hour = 23;
  time.tm_min = 59;
  time.tm_sec = 60;
  EXPECT_EQ(utc_seconds(time), 1709251200);
}

TEST(Calendar, AMonthBeyondTheYearCountsAsTheWholeYear) {
  const std::int64_t next_year = utc_seconds(tm_of(2025, 1, 1));
  for (const int month : {12, 98, INT_MAX}) {
    std::tm time = tm_of(2024, 1, 1);
    time.tm_mon = month;
    EXPECT_EQ(utc_seconds(time), next_year) << month;
  }
}

TEST(Calendar, AMonthBeforeTheYearCountsAsJanuary) {
  const std::int64_t january = utc_seconds(tm_of(2024, 1, 1));
  for (const int month : {-1, -100, INT_MIN}) {
    std::tm time = tm_of(2024, 1, 1);
    time.tm_mon = month;
    EXPECT_EQ(utc_seconds(time), january) << month;
  }
}

TEST(Calendar, YearsBeforeTheFirstAreCountedBackwards) {
  EXPECT_EQ(utc_seconds(tm_of(1, 1, 1)) - utc_seconds(tm_of(0, 1, 1)), std::int64_t{366} * 86400);
  EXPECT_EQ(utc_seconds(tm_of(0, 1, 1)) - utc_seconds(tm_of(-1, 1, 1)), std::int64_t{365} * 86400);
}

TEST(Calendar, ExtremesOfEveryFieldStayInRange) {
  for (const int extreme : {INT_MIN, INT_MAX}) {
    std::tm time{};
    time.tm_year = time.tm_mon = time.tm_mday = time.tm_hour = time.tm_min = time.tm_sec = extreme;
    EXPECT_EQ(utc_seconds(time) < 0, extreme < 0);
  }
}

TEST(Calendar, DaysIntoWeekWrapOverTheFirstDayAndTakeItModulo7) {
  const struct {
    int weekday;
    int first_day;
    int days;
  } cases[] = {{0, 0, 0}, {6, 0, 6}, {1, 1, 0},       {0, 1, 6},       {6, 1, 5}, {0, 6, 1},
               {5, 6, 6}, {1, 8, 0}, {0, INT_MAX, 6}, {0, INT_MIN, 2}, {3, -1, 4}};
  for (const auto& c : cases)
    EXPECT_EQ(days_into_week(c.weekday, c.first_day), c.days) << c.weekday << " " << c.first_day;
}

TEST(Calendar, WeeksOfEveryRuleEqualTheReferenceFrom1970To2100) {
  for (WalkedDay day; day.year <= 2100; day.next()) {
    const WeekDay today{day.year, day.day_of_year - 1, day.weekday};
    const auto by_days = test::reference_by_days(day);
    ASSERT_EQ(week_by_days(today), (YearWeek{by_days.year, by_days.week})) << day.year << " " << day.day_of_year;
    const auto iso = test::reference_by_iso(day);
    ASSERT_EQ(week_by_iso(today), (YearWeek{iso.year, iso.week})) << day.year << " " << day.day_of_year;
    for (int first_day = 0; first_day < 7; ++first_day) {
      const auto january = test::reference_of_january_first(day, first_day);
      ASSERT_EQ(week_of_january_first(today, first_day), (YearWeek{january.year, january.week}))
          << day.year << " " << day.day_of_year << " " << first_day;
    }
  }
}

}  // namespace
}  // namespace vexa
