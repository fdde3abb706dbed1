// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <climits>

#include "runtime/file_time.h"
#include "tests/runtime/in_zone.h"
#include "tests/runtime/week_reference.h"
#include "vexa/real_time.h"

namespace vexa {
namespace {

using test::InZone;
using test::kWideTime;
using test::WalkedDay;

/// Sets the process's week rule for a test.
class WithWeeks {
 public:
  WithWeeks(int rule, int first_day) {
    CRealTime::m_WeekAlgo = rule;
    CRealTime::m_FirstDayOfWeek = first_day;
  }
  ~WithWeeks() {
    CRealTime::m_WeekAlgo = 2;
    CRealTime::m_FirstDayOfWeek = 1;
  }
  WithWeeks(const WithWeeks&) = delete;
  WithWeeks& operator=(const WithWeeks&) = delete;
};

constexpr int kLastYear = kWideTime ? 2100 : 2037;

CRealTime local_noon(int year, int month, int day) {
  return CRealTime(static_cast<std::uint16_t>(year), static_cast<std::uint16_t>(month), static_cast<std::uint16_t>(day),
                   12, 0, 0, 0, 0, false);
}

CRealTime noon(const WalkedDay& day) { return local_noon(day.year, day.month, day.day); }

TEST(RealTimeWeek, LateDecemberAndEarlyJanuaryBelongWhereTheRulePutsThem) {
  const struct {
    int rule;
    int first_day;
    int year, month, day;
    int week, week_year;
  } cases[] = {{2, 1, 2021, 1, 3, 53, 2020},   {1, 1, 2021, 1, 3, 1, 2021},   {0, 1, 2021, 1, 3, 1, 2021},
               {2, 1, 2024, 12, 30, 1, 2025},  {1, 1, 2024, 12, 30, 1, 2025}, {0, 1, 2024, 12, 30, 53, 2024},
               {1, 0, 2024, 12, 28, 52, 2024}, {1, 0, 2024, 12, 29, 1, 2025}, {2, 1, 2022, 1, 1, 52, 2021},
               {2, 1, 2023, 1, 2, 1, 2023},    {0, 1, 2023, 1, 7, 1, 2023},   {0, 1, 2023, 1, 8, 2, 2023}};
  for (const auto& c : cases) {
    const WithWeeks weeks(c.rule, c.first_day);
    int week_year = 0;
    EXPECT_EQ(local_noon(c.year, c.month, c.day).GetWeek(&week_year), c.week) << c.rule << " " << c.year << c.month;
    EXPECT_EQ(week_year, c.week_year) << c.rule << " " << c.year << c.month;
  }
}

TEST(RealTimeWeek, WeekByDaysEqualsTheReferenceOnEveryDay) {
  for (int first_day = 0; first_day < 7; ++first_day) {
    const WithWeeks weeks(0, first_day);
    for (WalkedDay day; day.year <= kLastYear; day.next()) {
      const auto expected = test::reference_by_days(day);
      int year = 0;
      ASSERT_EQ(noon(day).GetWeek(&year), expected.week) << day.year << " " << day.day_of_year;
      ASSERT_EQ(year, expected.year) << day.year << " " << day.day_of_year;
    }
  }
}

TEST(RealTimeWeek, WeekOfJanuaryFirstEqualsTheReferenceOnEveryDay) {
  for (int first_day = 0; first_day < 7; ++first_day) {
    const WithWeeks weeks(1, first_day);
    for (WalkedDay day; day.year <= kLastYear; day.next()) {
      const auto expected = test::reference_of_january_first(day, first_day);
      int year = 0;
      ASSERT_EQ(noon(day).GetWeek(&year), expected.week) << day.year << " " << day.day_of_year;
      ASSERT_EQ(year, expected.year) << day.year << " " << day.day_of_year;
    }
  }
}

TEST(RealTimeWeek, IsoWeekEqualsTheCLibrarysOnEveryDayWhateverTheFirstDay) {
  for (int first_day = 0; first_day < 7; ++first_day) {
    const WithWeeks weeks(2, first_day);
    for (WalkedDay day; day.year <= kLastYear; day.next()) {
      const auto expected = test::reference_by_iso(day);
      int year = 0;
      ASSERT_EQ(noon(day).GetWeek(&year), expected.week) << day.year << " " << day.day_of_year;
      ASSERT_EQ(year, expected.year) << day.year << " " << day.day_of_year;
    }
  }
}

TEST(RealTimeWeek, DayOfYearAndFirstDayOfWeekEqualTheWalkOnEveryDay) {
  const InZone zone("UTC");
  for (int first_day = 0; first_day < 7; ++first_day) {
    const WithWeeks weeks(2, first_day);
    std::int64_t midnight = 0;
    std::int64_t week_begin = -1;
    for (WalkedDay day; day.year <= kLastYear; day.next(), midnight += 86400) {
      if (day.weekday == first_day) week_begin = midnight;
      const CRealTime time = noon(day);
      ASSERT_EQ(time.GetDayOfYear(), day.day_of_year) << day.year << " " << day.day_of_year;
      if (week_begin < 0) continue;
      ASSERT_EQ(ticks_of(time.GetFirstDayOfWeek().GetUtcFileTime()), ticks_of_unix(week_begin, 0)) << midnight;
    }
  }
}

TEST(RealTimeWeek, WeeksAreLocal) {
  const CRealTime sunday_evening(2024, 3, 3, 20, 0, 0, 0, 0, true);
  {
    const InZone zone("UTC");
    EXPECT_EQ(sunday_evening.GetWeek(nullptr), 9);
  }
  const InZone zone("Asia/Kolkata");
  EXPECT_EQ(sunday_evening.GetWeek(nullptr), 10);
}

TEST(RealTimeWeek, FirstDayOfWeekIsLocalMidnight) {
  const struct {
    const char* zone;
    int first_day;
    const char* text;
  } cases[] = {{"UTC", 1, "2026-03-02 00:00:00.000 Mon"},
               {"Europe/Amsterdam", 1, "2026-03-02 00:00:00.000 Mon"},
               {"Australia/Sydney", 0, "2026-03-01 00:00:00.000 Sun"},
               {"Asia/Kolkata", 4, "2026-03-05 00:00:00.000 Thu"},
               {"Asia/Kolkata", 5, "2026-02-27 00:00:00.000 Fri"}};
  for (const auto& c : cases) {
    const InZone zone(c.zone);
    const WithWeeks weeks(2, c.first_day);
    const CRealTime thursday(2026, 3, 5, 9, 7, 3, 45, 678, true);
    EXPECT_EQ(thursday.GetFirstDayOfWeek().Format("%Y-%O-%D %H:%M:%S.%03L %a", false), c.text) << c.zone;
  }
}

TEST(RealTimeWeek, TheFirstWeekOfTheCountHasNoFirstDayBeforeIt) {
  if (!kWideTime) GTEST_SKIP() << "a time_t of 32 bits does not reach it";
  const InZone zone("UTC");
  const CRealTime wednesday(file_time_of(2 * kTicksPerDay + 5));  // 1601-01-03
  EXPECT_EQ(wednesday.GetFirstDayOfWeek().Format("%Y-%O-%D", true), "1601-01-01");
  const WithWeeks weeks(2, 0);
  EXPECT_EQ(ticks_of(wednesday.GetFirstDayOfWeek().GetUtcFileTime()), 0U);
}

TEST(RealTimeWeek, AnUnknownRuleHasNoWeeksAndLeavesTheYear) {
  for (const int rule : {-1, 3, INT_MIN, INT_MAX}) {
    const WithWeeks weeks(rule, 1);
    int year = 77;
    EXPECT_EQ(local_noon(2026, 3, 5).GetWeek(&year), -1) << rule;
    EXPECT_EQ(year, 77) << rule;
    EXPECT_EQ(local_noon(2026, 3, 5).Format("%W %w %G %g", false), "-1 -1 0000 00") << rule;
  }
}

TEST(RealTimeWeek, FirstDaysOutsideTheWeekCountModulo7) {
  for (const int first_day : {-6, 8, 701}) {  // Monday
    const WithWeeks weeks(1, first_day);
    EXPECT_EQ(local_noon(2024, 12, 29).GetWeek(nullptr), 52) << first_day;
    EXPECT_EQ(local_noon(2024, 12, 30).GetWeek(nullptr), 1) << first_day;
  }
}

TEST(RealTimeWeek, TheWeekYearMayBeLeftOut) { EXPECT_EQ(local_noon(2026, 3, 5).GetWeek(nullptr), 10); }

}  // namespace
}  // namespace vexa
