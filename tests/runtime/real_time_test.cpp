// SPDX-License-Identifier: Apache-2.0
#include "vexa/real_time.h"

#include <gtest/gtest.h>

#include <array>
#include <string>
#include <type_traits>

#include "runtime/file_time.h"
#include "tests/runtime/in_zone.h"
#include "tests/runtime/ticks.h"

namespace vexa {
namespace {

using test::InZone;
using test::kWideTime;
using test::listed;
using test::ticks_at;
using test::ticks_in;

CRealTime at(std::int64_t unix_seconds, std::uint64_t more = 0) {
  return CRealTime(file_time_of(ticks_at(unix_seconds, more)));
}

constexpr std::int64_t kMarch5Seconds = 1772701623;  // 2026-03-05 09:07:03 UTC

static_assert(std::is_same_v<decltype(CRealTime::m_FirstDayOfWeek), int>);
static_assert(std::is_same_v<decltype(CRealTime::m_WeekAlgo), int>);
static_assert(std::is_same_v<decltype(CRealTime::m_SnapShotTime), CRealTime>);
static_assert(sizeof(CRealTime) == 8 && sizeof(CRealTimeSpan) == 8);

TEST(RealTime, IsUnsetAtFirst) { EXPECT_EQ(ticks_in(CRealTime()), 0U); }

TEST(RealTime, ProcessWideSettingsBeginWithIsoWeeksMondayAndNoSnapShot) {
  EXPECT_EQ(CRealTime::m_FirstDayOfWeek, 1);
  EXPECT_EQ(CRealTime::m_WeekAlgo, 2);
  EXPECT_EQ(ticks_in(CRealTime::m_SnapShotTime), 0U);
}

TEST(RealTime, KeepsTheFileTimeItIsGiven) {
  const CRealTime time(file_time_of(0x0123456789abcdef));
  EXPECT_EQ(ticks_in(time), 0x0123456789abcdefU);
  _FILETIME out{};
  time.GetUtcFileTime(out);
  EXPECT_EQ(ticks_of(out), 0x0123456789abcdefU);
}

TEST(RealTime, SystemTimeFieldsAreLocal) {
  const InZone zone("Asia/Kolkata");
  const _SYSTEMTIME fields{2026, 3, 0, 5, 14, 37, 3, 45};
  EXPECT_EQ(ticks_in(CRealTime(fields)), ticks_at(kMarch5Seconds, 450000));
}

TEST(RealTime, SystemTimeFieldsThatNameNoTimeLeaveItUnset) {
  EXPECT_EQ(ticks_in(CRealTime(_SYSTEMTIME{})), 0U);
  EXPECT_EQ(ticks_in(CRealTime(_SYSTEMTIME{1969, 12, 0, 31, 23, 59, 59, 0})), 0U);
}

TEST(RealTime, FieldsAreUtcOrLocalByTheFlagAndCountMicroseconds) {
  const InZone zone("Asia/Kolkata");
  EXPECT_EQ(ticks_in(CRealTime(2026, 3, 5, 9, 7, 3, 45, 678, true)), ticks_at(kMarch5Seconds, 456780));
  EXPECT_EQ(ticks_in(CRealTime(2026, 3, 5, 14, 37, 3, 45, 678, false)), ticks_at(kMarch5Seconds, 456780));
  EXPECT_EQ(ticks_in(CRealTime(2026, 3, 5, 9, 7, 3, 45, 65535, true)), ticks_at(kMarch5Seconds, 450000 + 655350));
}

TEST(RealTime, FieldsThatNameNoTimeLeaveItUnsetWhateverTheirMicroseconds) {
  EXPECT_EQ(ticks_in(CRealTime(0, 0, 0, 0, 0, 0, 0, 999, true)), 0U);
  EXPECT_EQ(ticks_in(CRealTime(65535, 1, 1, 0, 0, 0, 0, 999, false)), 0U);
}

TEST(RealTime, MicrosecondsCountFromTheFirstMomentOn) {
  if (!kWideTime) GTEST_SKIP() << "a time_t of 32 bits does not reach it";
  EXPECT_EQ(ticks_in(CRealTime(1601, 1, 1, 0, 0, 0, 0, 5, true)), 50U);
}

TEST(RealTime, SecondsAreUtcOrLocalByTheFlag) {
  const InZone zone("Asia/Kolkata");
  EXPECT_EQ(ticks_in(CRealTime(std::time_t{kMarch5Seconds}, true)), ticks_at(kMarch5Seconds));
  EXPECT_EQ(ticks_in(CRealTime(std::time_t{kMarch5Seconds} + 19800, false)), ticks_at(kMarch5Seconds));
  EXPECT_EQ(ticks_in(CRealTime(std::time_t{0}, true)), ticks_at(0));
  EXPECT_EQ(ticks_in(CRealTime(std::time_t{-1}, true)), ticks_at(-1));
}

TEST(RealTime, TicksAreAddedToSeconds) {
  const InZone zone("Asia/Kolkata");
  EXPECT_EQ(ticks_in(CRealTime(std::time_t{kMarch5Seconds}, 1234567, true)), ticks_at(kMarch5Seconds, 1234567));
  EXPECT_EQ(ticks_in(CRealTime(std::time_t{kMarch5Seconds}, -10000000, true)), ticks_at(kMarch5Seconds - 1));
  EXPECT_EQ(ticks_in(CRealTime(std::time_t{kMarch5Seconds} + 19800, 7, false)), ticks_at(kMarch5Seconds, 7));
}

TEST(RealTime, TicksThatLeaveTheCountLeaveItUnset) {
  EXPECT_EQ(ticks_in(CRealTime(std::time_t{0}, INT64_MIN, true)), 0U);
  EXPECT_EQ(ticks_in(CRealTime(std::time_t{0}, -116444736000000001, true)), 0U);
  EXPECT_EQ(ticks_in(CRealTime(std::time_t{0}, -116444735999999999, true)), 1U);
  EXPECT_EQ(ticks_in(CRealTime(std::time_t{0}, INT64_MAX, true)), 116444736000000000U + INT64_MAX);
}

TEST(RealTime, SecondsOutsideTheCountLeaveItUnset) {
  if (!kWideTime) GTEST_SKIP() << "a time_t of 32 bits never leaves the count";
  for (const std::int64_t seconds : {INT64_MIN, std::int64_t{-11644473601}, std::int64_t{1833029933771}, INT64_MAX}) {
    EXPECT_EQ(ticks_in(CRealTime(static_cast<std::time_t>(seconds), true)), 0U) << seconds;
    EXPECT_EQ(ticks_in(CRealTime(static_cast<std::time_t>(seconds), false)), 0U) << seconds;
  }
  EXPECT_EQ(ticks_in(CRealTime(static_cast<std::time_t>(1833029933770), INT64_MAX, true)), 0U);
  EXPECT_EQ(ticks_in(CRealTime(static_cast<std::time_t>(-11644473601), 10000001, true)), 0U);
}

TEST(RealTime, TextIsReadInTheOrderTheLoggerWritesIt) {
  const struct {
    const char* text;
    std::uint64_t ticks;
  } cases[] = {{"05-03-2026 09:07:03.045", ticks_at(kMarch5Seconds, 450000)},
               {"5-3-2026 9:7:3.45", ticks_at(kMarch5Seconds, 450000)},
               {"05-03-26 09:07:03.045", ticks_at(kMarch5Seconds, 450000)},
               {"05-03-2026\t09:07:03.045\tcamera", ticks_at(kMarch5Seconds, 450000)},
               {"  05- 03- 2026   09: 07: 03. 045", ticks_at(kMarch5Seconds, 450000)},
               {"05-03-202609:07:03", 0},
               {"05-03-2026 09:07:03", ticks_at(kMarch5Seconds)},
               {"05-03-2026 09:07:03,045", ticks_at(kMarch5Seconds)},
               {"05-03-2026 09:07", ticks_at(kMarch5Seconds - 3)},
               {"05-03-2026 09:07:x", ticks_at(kMarch5Seconds - 3)},
               {"05-03-2026 09:07.5", ticks_at(kMarch5Seconds - 3)},
               {"01-01-00 00:00:00.000", ticks_at(946684800)},
               {"01-01-70 00:00:00.000", kWideTime ? ticks_at(3155760000) : 0},
               {"31-12-99 00:00:00.000", kWideTime ? ticks_at(4102358400) : 0},
               {"01-01-100 00:00:00.000", 0}};
  for (const auto& c : cases) EXPECT_EQ(ticks_in(CRealTime(c.text, true)), c.ticks) << c.text;
}

TEST(RealTime, TextIsLocalWithoutTheFlag) {
  const InZone zone("Asia/Kolkata");
  EXPECT_EQ(ticks_in(CRealTime("05-03-2026 14:37:03.045", false)), ticks_at(kMarch5Seconds, 450000));
}

TEST(RealTime, WhatFollowsThePointInATextIsACountOfMilliseconds) {
  EXPECT_EQ(ticks_in(CRealTime("05-03-2026 09:07:03.5", true)), ticks_at(kMarch5Seconds, 50000));
  EXPECT_EQ(ticks_in(CRealTime("05-03-2026 09:07:03.1500", true)), ticks_at(kMarch5Seconds + 1, 5000000));
}

TEST(RealTime, TextWithFewerThanFiveNumbersLeavesItUnset) {
  for (const char* text : {"", "x", "05", "05-03", "05-03-2026", "05-03-2026 09", "05-03-2026 09:", "05/03/2026 09:07",
                           "05 -03-2026 09:07", "-05-03-2026 09:07"}) {
    EXPECT_EQ(ticks_in(CRealTime(text, true)), 0U) << text;
  }
  EXPECT_EQ(ticks_in(CRealTime(static_cast<const char*>(nullptr), true)), 0U);
}

TEST(RealTime, TextWithANumberThatNoFieldHoldsLeavesItUnset) {
  for (const char* text : {"65541-03-2026 09:07:03", "05-03-67562 09:07:03", "4294967301-03-2026 09:07:03",
                           "05-03-2026 09:07:-3", "05-03-2026 09:07:03.65536", "05--3-2026 09:07:03"}) {
    EXPECT_EQ(ticks_in(CRealTime(text, true)), 0U) << text;
  }
}

TEST(RealTime, TheCurrentTimeIsNowInWholeMilliseconds) {
  _SYSTEMTIME before{};
  _SYSTEMTIME after{};
  GetSystemTime(&before);
  const std::uint64_t now = ticks_in(CRealTime::GetTheCurrentTime());
  GetSystemTime(&after);
  _FILETIME first{};
  _FILETIME last{};
  SystemTimeToFileTime(&before, &first);
  SystemTimeToFileTime(&after, &last);
  EXPECT_GE(now, ticks_of(first));
  EXPECT_LE(now, ticks_of(last));
  EXPECT_EQ(now % 10000, 0U);
}

TEST(RealTime, GivesItsFieldsInUtcAndInLocalTime) {
  const InZone zone("Australia/Sydney");
  const CRealTime time = at(kMarch5Seconds, 456789);
  const std::array<int, 8> utc = {2026, 3, 4, 5, 9, 7, 3, 45};
  const std::array<int, 8> local = {2026, 3, 4, 5, 20, 7, 3, 45};
  EXPECT_EQ(listed(time.GetUtcSystemTime()), utc);
  EXPECT_EQ(listed(time.GetLocalSystemTime()), local);
  _SYSTEMTIME fields{};
  time.GetUtcSystemTime(fields);
  EXPECT_EQ(listed(fields), utc);
  time.GetLocalSystemTime(fields);
  EXPECT_EQ(listed(fields), local);
}

TEST(RealTime, LocalFieldsFollowTheChangesOfFourZones) {
  const struct {
    const char* zone;
    std::int64_t seconds;
    std::array<int, 8> local;
  } cases[] = {{"UTC", 1711846800, {2024, 3, 0, 31, 1, 0, 0, 0}},
               {"Europe/Amsterdam", 1711846799, {2024, 3, 0, 31, 1, 59, 59, 0}},
               {"Europe/Amsterdam", 1711846800, {2024, 3, 0, 31, 3, 0, 0, 0}},
               {"Europe/Amsterdam", 1729990799, {2024, 10, 0, 27, 2, 59, 59, 0}},
               {"Europe/Amsterdam", 1729990800, {2024, 10, 0, 27, 2, 0, 0, 0}},
               {"Australia/Sydney", 1712419199, {2024, 4, 0, 7, 2, 59, 59, 0}},
               {"Australia/Sydney", 1712419200, {2024, 4, 0, 7, 2, 0, 0, 0}},
               {"Australia/Sydney", 1728143999, {2024, 10, 0, 6, 1, 59, 59, 0}},
               {"Australia/Sydney", 1728144000, {2024, 10, 0, 6, 3, 0, 0, 0}},
               {"Asia/Kolkata", 1711846800, {2024, 3, 0, 31, 6, 30, 0, 0}}};
  for (const auto& c : cases) {
    const InZone zone(c.zone);
    EXPECT_EQ(listed(at(c.seconds).GetLocalSystemTime()), c.local) << c.zone << " " << c.seconds;
  }
}

TEST(RealTime, HasNoLocalFieldsWhereTheShiftLeavesTheCount) {
  if (!kWideTime) GTEST_SKIP() << "a time_t of 32 bits never comes near the ends";
  const InZone zone("America/New_York");
  const CRealTime unset;
  EXPECT_EQ(listed(unset.GetLocalSystemTime()), (std::array<int, 8>{}));
  EXPECT_EQ(unset.GetDayOfYear(), -1);
  EXPECT_EQ(ticks_in(unset.GetFirstDayOfWeek()), 0U);
  int year = 77;
  EXPECT_EQ(unset.GetWeek(&year), -1);
  EXPECT_EQ(year, 77);
  EXPECT_EQ(unset.Format("%Y %o %d %B %b %N %n %a %w %W %G %g %X %x", false),
            "0000 0 0 Unknown *** onbekend *** Sun -1 -1 0000 00 -1 -1");
}

TEST(RealTime, LocalTimeTimeIsWholeSecondsSince1970) {
  for (const char* name : {"UTC", "Europe/Amsterdam", "Australia/Sydney", "Asia/Kolkata"}) {
    const InZone zone(name);
    EXPECT_EQ(at(kMarch5Seconds, 9999999).GetLocalTimeTime(false), kMarch5Seconds) << name;
  }
}

TEST(RealTime, LocalTimeTimeOfTheTimeOfDayIsOn2000_01_01) {
  const InZone zone("Asia/Kolkata");
  // 14:37:03 local is 09:07:03 UTC.
  EXPECT_EQ(at(kMarch5Seconds).GetLocalTimeTime(true), 946684800 + 9 * 3600 + 7 * 60 + 3);
}

TEST(RealTime, LocalTimeTimeOfAnUnsetTimeIs0) {
  EXPECT_EQ(CRealTime().GetLocalTimeTime(false), 0);
  EXPECT_EQ(CRealTime().GetLocalTimeTime(true), 0);
}

TEST(RealTime, DayOfYearIsLocal) {
  const InZone zone("Asia/Kolkata");
  EXPECT_EQ(at(1735669800).GetDayOfYear(), 1);    // 2024-12-31 18:30 UTC
  EXPECT_EQ(at(1735669799).GetDayOfYear(), 366);  // the second before
}

TEST(RealTime, DaysInMonthAndLeapYearsAreTheCalendars) {
  EXPECT_EQ(CRealTime::GetDaysInMonth(1900, 2), 28);
  EXPECT_EQ(CRealTime::GetDaysInMonth(2000, 2), 29);
  EXPECT_EQ(CRealTime::GetDaysInMonth(2000, 0), -1);
  EXPECT_EQ(CRealTime::GetDaysInMonth(2000, 13), -1);
  EXPECT_TRUE(CRealTime::IsLeapYear(2024));
  EXPECT_FALSE(CRealTime::IsLeapYear(2100));
}

}  // namespace
}  // namespace vexa
