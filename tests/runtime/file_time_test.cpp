// SPDX-License-Identifier: Apache-2.0
#include "runtime/file_time.h"

#include <gtest/gtest.h>
#include <sys/time.h>

#include <array>

#include "tests/runtime/in_zone.h"
#include "tests/runtime/ticks.h"

namespace vexa {
namespace {

using test::InZone;
using test::kWideTime;
using test::listed;
using test::ticks_at;

std::uint64_t to_local(std::uint64_t ticks) {
  const _FILETIME utc = file_time_of(ticks);
  _FILETIME local{};
  EXPECT_TRUE(FileTimeToLocalFileTime(&utc, &local));
  return ticks_of(local);
}

std::uint64_t to_utc(std::uint64_t ticks) {
  const _FILETIME local = file_time_of(ticks);
  _FILETIME utc{};
  EXPECT_TRUE(LocalFileTimeToFileTime(&local, &utc));
  return ticks_of(utc);
}

TEST(FileTime, IsTwoHalvesOfOneCount) {
  const _FILETIME time = file_time_of(0x0123456789abcdef);
  EXPECT_EQ(time.dwHighDateTime, 0x01234567U);
  EXPECT_EQ(time.dwLowDateTime, 0x89abcdefU);
  EXPECT_EQ(ticks_of(time), 0x0123456789abcdefU);
  EXPECT_EQ(sizeof(_FILETIME), 8U);
}

TEST(FileTime, SystemTimeIsEightFieldsOf16Bits) { EXPECT_EQ(sizeof(_SYSTEMTIME), 16U); }

TEST(FileTime, FieldsAndTicksNameTheSameMoments) {
  const struct {
    _SYSTEMTIME fields;
    std::uint64_t ticks;
  } cases[] = {{{1970, 1, 4, 1, 0, 0, 0, 0}, 116444736000000000},
               {{1970, 1, 4, 1, 0, 0, 0, 1}, 116444736000010000},
               {{2026, 3, 4, 5, 9, 7, 3, 45}, ticks_at(1772701623, 450000)},
               {{2000, 2, 2, 29, 23, 59, 59, 999}, ticks_at(951868799, 9990000)},
               {{1969, 12, 3, 31, 23, 59, 58, 0}, ticks_at(-2)},
               {{2038, 1, 2, 19, 3, 14, 7, 0}, ticks_at(2147483647)},
               {{1901, 12, 5, 13, 20, 45, 52, 0}, ticks_at(-2147483648)}};
  for (const auto& c : cases) {
    _FILETIME time{};
    ASSERT_TRUE(SystemTimeToFileTime(&c.fields, &time)) << c.ticks;
    EXPECT_EQ(ticks_of(time), c.ticks);
    _SYSTEMTIME fields{};
    ASSERT_TRUE(FileTimeToSystemTime(&time, &fields)) << c.ticks;
    EXPECT_EQ(listed(fields), listed(c.fields)) << c.ticks;
  }
}

TEST(FileTime, SecondsAreAsWideAsThePlatformsTime) {
  const struct {
    std::uint64_t ticks;
    std::array<int, 8> wide;
    std::array<int, 8> narrow;
  } cases[] = {{ticks_at(2147483648), {2038, 1, 2, 19, 3, 14, 8, 0}, {1901, 12, 5, 13, 20, 45, 52, 0}},
               {ticks_at(4102444800), {2100, 1, 5, 1, 0, 0, 0, 0}, {1963, 11, 1, 25, 17, 31, 44, 0}},
               {0, {1601, 1, 1, 1, 0, 0, 0, 0}, {2009, 4, 3, 22, 19, 24, 48, 0}},
               {UINT64_MAX, {60056, 5, 0, 28, 5, 36, 10, 955}, {1940, 10, 4, 24, 2, 26, 18, 955}}};
  for (const auto& c : cases) {
    const _FILETIME time = file_time_of(c.ticks);
    _SYSTEMTIME fields{};
    ASSERT_TRUE(FileTimeToSystemTime(&time, &fields)) << c.ticks;
    EXPECT_EQ(listed(fields), kWideTime ? c.wide : c.narrow) << c.ticks;
  }
}

TEST(FileTime, FieldsBeyond2038ConvertWhereThePlatformsTimeReachesThem) {
  const _SYSTEMTIME fields{2100, 1, 0, 1, 0, 0, 0, 0};
  _FILETIME time{};
  ASSERT_EQ(SystemTimeToFileTime(&fields, &time), kWideTime);
  EXPECT_EQ(ticks_of(time), kWideTime ? ticks_at(4102444800) : 0);
}

TEST(FileTime, TheDayOfTheWeekIsNotReadAndWhatIsBelowAMillisecondIsDropped) {
  const _SYSTEMTIME fields{2026, 3, 65535, 5, 9, 7, 3, 45};
  _FILETIME time{};
  ASSERT_TRUE(SystemTimeToFileTime(&fields, &time));
  time = file_time_of(ticks_of(time) + 9999);
  _SYSTEMTIME back{};
  ASSERT_TRUE(FileTimeToSystemTime(&time, &back));
  EXPECT_EQ(back.wMilliseconds, 45);
  EXPECT_EQ(back.wDayOfWeek, 4);
}

TEST(FileTime, FieldsBeyondTheirRangesAreCarried) {
  const _SYSTEMTIME fields{2026, 13, 0, 32, 24, 60, 60, 65535};
  _FILETIME time{};
  ASSERT_TRUE(SystemTimeToFileTime(&fields, &time));
  EXPECT_EQ(ticks_of(time), ticks_at(1801530060, 655350000));  // 2027-02-02 01:01:00 and 65535 ms
}

TEST(FileTime, TheSecondBefore1970CannotBeConverted) {
  const _SYSTEMTIME fields{1969, 12, 0, 31, 23, 59, 59, 0};
  _FILETIME time{7, 9};
  EXPECT_FALSE(SystemTimeToFileTime(&fields, &time));
  EXPECT_EQ(time.dwLowDateTime, 7U);
  EXPECT_EQ(time.dwHighDateTime, 9U);
}

TEST(FileTime, FieldsOutsideTheCountFailAndChangeNothing) {
  const _SYSTEMTIME cases[] = {{1600, 12, 0, 31, 23, 59, 59, 999},
                               {0, 0, 0, 0, 0, 0, 0, 0},
                               {65535, 65535, 65535, 65535, 65535, 65535, 65535, 65535},
                               {60056, 5, 0, 28, 5, 36, 10, 956},
                               {60056, 5, 0, 28, 5, 36, 11, 0}};
  for (const auto& fields : cases) {
    _FILETIME time{7, 9};
    EXPECT_FALSE(SystemTimeToFileTime(&fields, &time)) << fields.wYear;
    EXPECT_EQ(ticks_of(time), (std::uint64_t{9} << 32) + 7);
  }
}

TEST(FileTime, TheFirstAndTheLastMillisecondOfTheCountConvert) {
  if (!kWideTime) GTEST_SKIP() << "a time_t of 32 bits does not reach them";
  const struct {
    _SYSTEMTIME fields;
    std::uint64_t ticks;
  } cases[] = {{{1601, 1, 0, 1, 0, 0, 0, 0}, 0}, {{60056, 5, 0, 28, 5, 36, 10, 955}, 18446744073709550000U}};
  for (const auto& c : cases) {
    _FILETIME time{7, 9};
    ASSERT_TRUE(SystemTimeToFileTime(&c.fields, &time));
    EXPECT_EQ(ticks_of(time), c.ticks);
  }
}

TEST(FileTime, NullPointersFail) {
  const _SYSTEMTIME fields{2026, 3, 0, 5, 0, 0, 0, 0};
  const _FILETIME time = file_time_of(ticks_at(0));
  _SYSTEMTIME out_fields{};
  _FILETIME out_time{};
  EXPECT_FALSE(GetSystemTime(nullptr));
  EXPECT_FALSE(SystemTimeToFileTime(nullptr, &out_time));
  EXPECT_FALSE(SystemTimeToFileTime(&fields, nullptr));
  EXPECT_FALSE(FileTimeToSystemTime(nullptr, &out_fields));
  EXPECT_FALSE(FileTimeToSystemTime(&time, nullptr));
  EXPECT_FALSE(FileTimeToLocalFileTime(nullptr, &out_time));
  EXPECT_FALSE(FileTimeToLocalFileTime(&time, nullptr));
  EXPECT_FALSE(LocalFileTimeToFileTime(nullptr, &out_time));
  EXPECT_FALSE(LocalFileTimeToFileTime(&time, nullptr));
  EXPECT_FALSE(SystemTimeToTzSpecificLocalTime(nullptr, nullptr, &out_fields));
  EXPECT_FALSE(SystemTimeToTzSpecificLocalTime(nullptr, &fields, nullptr));
}

TEST(FileTime, SystemTimeIsThePresentInUtcToTheMillisecond) {
  const InZone zone("Asia/Kolkata");
  timeval before{};
  timeval after{};
  _SYSTEMTIME now{};
  gettimeofday(&before, nullptr);
  ASSERT_TRUE(GetSystemTime(&now));
  gettimeofday(&after, nullptr);
  _FILETIME time{};
  ASSERT_TRUE(SystemTimeToFileTime(&now, &time));
  EXPECT_GE(ticks_of(time), ticks_at(before.tv_sec, static_cast<std::uint64_t>(before.tv_usec / 1000) * 10000));
  EXPECT_LE(ticks_of(time), ticks_at(after.tv_sec, static_cast<std::uint64_t>(after.tv_usec / 1000) * 10000));
  _SYSTEMTIME again{};
  ASSERT_TRUE(FileTimeToSystemTime(&time, &again));
  EXPECT_EQ(listed(again), listed(now));
}

// The rules of the four zones, written here anew: seconds from UTC at a moment.
std::int64_t sunday_at(int year, int month, int nth, int hour) {
  std::tm time{};
  time.tm_year = year - 1900;
  time.tm_mon = nth > 0 ? month - 1 : month;
  time.tm_mday = 1;
  timegm(&time);
  const int first_sunday = 1 + (7 - time.tm_wday) % 7;
  time.tm_mday = nth > 0 ? first_sunday + 7 * (nth - 1) : first_sunday - 7;
  time.tm_hour = hour;
  return timegm(&time);
}

int year_of(std::int64_t seconds) {
  const auto time = static_cast<std::time_t>(seconds);
  std::tm parts{};
  gmtime_r(&time, &parts);
  return parts.tm_year + 1900;
}

std::int64_t utc_offset(std::int64_t /*seconds*/) { return 0; }

std::int64_t kolkata_offset(std::int64_t /*seconds*/) { return 19800; }

std::int64_t amsterdam_offset(std::int64_t seconds) {
  const int year = year_of(seconds);
  const bool summer = seconds >= sunday_at(year, 3, -1, 1) && seconds < sunday_at(year, 10, -1, 1);
  return summer ? 7200 : 3600;
}

std::int64_t sydney_offset(std::int64_t seconds) {
  const int year = year_of(seconds);
  const bool winter = seconds >= sunday_at(year, 4, 1, -8) && seconds < sunday_at(year, 10, 1, -8);
  return winter ? 36000 : 39600;
}

struct Zone {
  const char* name;
  std::int64_t (*offset)(std::int64_t seconds);
};

constexpr Zone kZones[] = {{"UTC", utc_offset},
                           {"Europe/Amsterdam", amsterdam_offset},
                           {"Australia/Sydney", sydney_offset},
                           {"Asia/Kolkata", kolkata_offset}};

TEST(FileTime, LocalTimesFollowTheOffsetOfTheMomentEveryHourOfThreeDecades) {
  for (const Zone& zone : kZones) {
    const InZone in_zone(zone.name);
    for (std::int64_t seconds = 1230768000; seconds < 2145916800; seconds += 3600) {  // 2009 to 2037
      ASSERT_EQ(to_local(ticks_at(seconds)), ticks_at(seconds + zone.offset(seconds))) << zone.name << " " << seconds;
    }
  }
}

TEST(FileTime, LocalTimesFollowTheOffsetToTheSecondOfItsChange) {
  const struct {
    const char* zone;
    std::int64_t change;
    std::int64_t before;
    std::int64_t after;
  } cases[] = {{"Europe/Amsterdam", 1711846800, 3600, 7200},
               {"Europe/Amsterdam", 1729990800, 7200, 3600},
               {"Australia/Sydney", 1712419200, 39600, 36000},
               {"Australia/Sydney", 1728144000, 36000, 39600}};
  for (const auto& c : cases) {
    const InZone in_zone(c.zone);
    EXPECT_EQ(to_local(ticks_at(c.change - 1)), ticks_at(c.change - 1 + c.before)) << c.zone << " " << c.change;
    EXPECT_EQ(to_local(ticks_at(c.change)), ticks_at(c.change + c.after)) << c.zone << " " << c.change;
  }
}

TEST(FileTime, LocalTimesTakeTheOffsetThatHoldsWhenTheyAreReadAsUtc) {
  for (const Zone& zone : kZones) {
    const InZone in_zone(zone.name);
    for (std::int64_t seconds = 1704067200; seconds < 1767225600; seconds += 1800) {  // 2024 and 2025
      ASSERT_EQ(to_utc(ticks_at(seconds)), ticks_at(seconds - zone.offset(seconds))) << zone.name << " " << seconds;
    }
  }
}

TEST(FileTime, ALocalTimeShortlyBeforeSummerTimeComesOutAnHourEarly) {
  const InZone zone("Europe/Amsterdam");
  const std::int64_t utc = 1711845000;  // 2024-03-31 00:30 UTC, 01:30 local
  EXPECT_EQ(to_local(ticks_at(utc)), ticks_at(utc + 3600));
  EXPECT_EQ(to_utc(ticks_at(utc + 3600)), ticks_at(utc - 3600));
}

TEST(FileTime, LocalAndUtcComeBackToEachOtherAwayFromChanges) {
  for (const Zone& zone : kZones) {
    const InZone in_zone(zone.name);
    for (const std::int64_t seconds : {1705312800, 1721037600}) {  // 15 January and 15 July 2024
      EXPECT_EQ(to_utc(to_local(ticks_at(seconds))), ticks_at(seconds)) << zone.name;
    }
  }
}

TEST(FileTime, TheLastDigitOfTheTicksIsDroppedInBothDirections) {
  const InZone zone("Europe/Amsterdam");
  EXPECT_EQ(to_local(ticks_at(1705312800, 1234567)), ticks_at(1705316400, 1234560));
  EXPECT_EQ(to_utc(ticks_at(1705316400, 9999999)), ticks_at(1705312800, 9999990));
}

TEST(FileTime, AShiftBeyondTheEndsOfTheCountFailsAndChangesNothing) {
  if (!kWideTime) GTEST_SKIP() << "a time_t of 32 bits never comes near the ends";
  const InZone zone("Asia/Kolkata");
  const _FILETIME last = file_time_of(UINT64_MAX);
  const _FILETIME first = file_time_of(0);
  _FILETIME time{7, 9};
  EXPECT_FALSE(FileTimeToLocalFileTime(&last, &time));
  EXPECT_FALSE(LocalFileTimeToFileTime(&first, &time));
  EXPECT_EQ(ticks_of(time), (std::uint64_t{9} << 32) + 7);
}

TEST(FileTime, UtcFieldsBecomeLocalFieldsWithoutATimeZoneArgument) {
  const InZone zone("Asia/Kolkata");
  const _SYSTEMTIME utc{2026, 3, 0, 5, 20, 7, 3, 45};
  _SYSTEMTIME local{};
  ASSERT_TRUE(SystemTimeToTzSpecificLocalTime(nullptr, &utc, &local));
  EXPECT_EQ(listed(local), (std::array<int, 8>{2026, 3, 5, 6, 1, 37, 3, 45}));
}

TEST(FileTime, AnyTimeZoneArgumentFails) {
  const _SYSTEMTIME utc{2026, 3, 0, 5, 20, 7, 3, 45};
  _SYSTEMTIME local{};
  int zone = 0;
  EXPECT_FALSE(SystemTimeToTzSpecificLocalTime(reinterpret_cast<const _TIME_ZONE_INFORMATION*>(&zone), &utc, &local));
  EXPECT_EQ(local.wYear, 0);
}

TEST(FileTime, UnixSecondsBecomeTicksWithinTheCount) {
  EXPECT_EQ(ticks_of_unix(0, 0), 116444736000000000U);
  EXPECT_EQ(ticks_of_unix(-11644473600, 0), 0U);
  EXPECT_EQ(ticks_of_unix(-11644473601, 0), std::nullopt);
  EXPECT_EQ(ticks_of_unix(1833029933770, 9551615), UINT64_MAX);
  EXPECT_EQ(ticks_of_unix(1833029933770, 9551616), std::nullopt);
  EXPECT_EQ(ticks_of_unix(1833029933771, 0), std::nullopt);
  EXPECT_EQ(ticks_of_unix(INT64_MAX, 0), std::nullopt);
  EXPECT_EQ(ticks_of_unix(INT64_MIN, 0), std::nullopt);
}

}  // namespace
}  // namespace vexa
