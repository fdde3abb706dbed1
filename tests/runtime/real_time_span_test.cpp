// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <climits>
#include <random>
#include <string>

#include "runtime/file_time.h"
#include "runtime/real_time_format.h"
#include "tests/runtime/in_zone.h"
#include "vexa/real_time.h"

namespace vexa {
namespace {

using test::InZone;

constexpr std::int64_t kSecond = 10000000;
constexpr std::int64_t kMillisecond = 10000;
constexpr std::int64_t kDay = 864000000000;
/// 2 days, 3 hours, 4 minutes, 5 seconds, 6 milliseconds and 7 ticks
constexpr std::int64_t kSample = 2 * kDay + 3 * 36000000000 + 240 * kSecond + 5 * kSecond + 6 * kMillisecond + 7;

TEST(RealTimeSpan, TickUnitsAreThoseOf100Nanoseconds) {
  EXPECT_EQ(kTicksPerSecond, 10000000U);
  EXPECT_EQ(kTicksPerMinute, 600000000U);
  EXPECT_EQ(kTicksPerHour, 36000000000U);
  EXPECT_EQ(kTicksPerDay, 864000000000U);
}

TEST(RealTimeSpan, EveryLetterWritesItsCount) {
  const struct {
    const char* format;
    const char* text;
  } cases[] = {{"%%", "%"},
               {"%D", "2"},
               {"%H", "51"},
               {"%M", "3064"},
               {"%S", "183845"},
               {"%L", "183845006"},
               {"%d", "2"},
               {"%h", "3"},
               {"%m", "4"},
               {"%s", "5"},
               {"%l", "6"},
               {"%T", "2 days 3:04:05"},
               {"%C", "2 days 3 hours 4 minutes 5 seconds"},
               {"%F", "2 days 3 hours 4 minutes 5 seconds 6 milliseconds"},
               {"%c", "2 days"},
               {"%i", "6 milliseconds"}};
  for (const auto& c : cases) EXPECT_EQ(format_span(c.format, kSample), c.text) << c.format;
}

TEST(RealTimeSpan, NumbersTakeFlagsAndWordsDropThem) {
  const struct {
    const char* format;
    const char* text;
  } cases[] = {{"%02h:%02m:%02s.%03l", "03:04:05.006"},
               {"[%5D]", "[    2]"},
               {"[%-5H]", "[51   ]"},
               {"%.6M", "003064"},
               {"%08S", "00183845"},
               {"[%12L]", "[   183845006]"},
               {"%03d", "002"},
               {"%09T", "2 days 3:04:05"},
               {"%-30C|", "2 days 3 hours 4 minutes 5 seconds|"},
               {"%.2c", "2 days"},
               {"%99i", "6 milliseconds"},
               {"%5F", "2 days 3 hours 4 minutes 5 seconds 6 milliseconds"},
               {"%7%", "%"}};
  for (const auto& c : cases) EXPECT_EQ(format_span(c.format, kSample), c.text) << c.format;
}

TEST(RealTimeSpan, OneIsSingularAndAllElsePlural) {
  const std::int64_t one_of_each = kDay + 36000000000 + 61 * kSecond + kMillisecond;
  EXPECT_EQ(format_span("%F", one_of_each), "1 day 1 hour 1 minute 1 second 1 millisecond");
  EXPECT_EQ(format_span("%T", one_of_each), "1 day 1:01:01");
  EXPECT_EQ(format_span("%F", 2 * one_of_each), "2 days 2 hours 2 minutes 2 seconds 2 milliseconds");
  EXPECT_EQ(format_span("%F", 0), "0 days 0 hours 0 minutes 0 seconds 0 milliseconds");
  EXPECT_EQ(format_span("%T", 0), "0 days 0:00:00");
  EXPECT_EQ(format_span("%i", 0), "0 milliseconds");
}

TEST(RealTimeSpan, WordsLeaveOutWhatIsZero) {
  const struct {
    std::int64_t ticks;
    const char* used;
    const char* largest;
  } cases[] = {{0, "0 seconds", "0 seconds"},
               {kMillisecond - 1, "0 seconds", "0 seconds"},
               {kMillisecond, "0 seconds", "1 millisecond"},
               {kSecond - 1, "0 seconds", "999 milliseconds"},
               {kSecond, "1 second", "1 second"},
               {59 * kSecond, "59 seconds", "59 seconds"},
               {60 * kSecond, "1 minute", "1 minute"},
               {3600 * kSecond, "1 hour", "1 hour"},
               {3605 * kSecond, "1 hour 5 seconds", "1 hour"},
               {kDay, "1 day", "1 day"},
               {kDay + 180 * kSecond, "1 day 3 minutes", "1 day"},
               {kDay - 1, "23 hours 59 minutes 59 seconds", "23 hours"}};
  for (const auto& c : cases) {
    EXPECT_EQ(format_span("%C", c.ticks), c.used) << c.ticks;
    EXPECT_EQ(format_span("%c", c.ticks), c.largest) << c.ticks;
  }
}

TEST(RealTimeSpan, NegativeSpansHaveNegativeNumbersAndOneSignBeforeWords) {
  EXPECT_EQ(format_span("%D %H %M %S %L", -kSample), "-2 -51 -3064 -183845 -183845006");
  EXPECT_EQ(format_span("%d %h %m %s %l", -kSample), "-2 -3 -4 -5 -6");
  EXPECT_EQ(format_span("%T", -kSample), "-2 days 3:04:05");
  EXPECT_EQ(format_span("%C", -kSample), "-2 days 3 hours 4 minutes 5 seconds");
  EXPECT_EQ(format_span("%c|%i", -kSample), "-2 days|-6 milliseconds");
  EXPECT_EQ(format_span("%02h", -36000000000), "-1");
}

TEST(RealTimeSpan, TheLongestSpansAreWrittenWhole) {
  EXPECT_EQ(format_span("%D %L", INT64_MAX), "10675199 922337203685477");
  EXPECT_EQ(format_span("%D %L", INT64_MIN), "-10675199 -922337203685477");
  EXPECT_EQ(format_span("%F", INT64_MIN), "-10675199 days 2 hours 48 minutes 5 seconds 477 milliseconds");
}

TEST(RealTimeSpan, OtherLettersAreCopiedWithTheirFlags) {
  for (int byte = 1; byte < 256; ++byte) {
    const char letter = static_cast<char>(byte);
    if (std::string("%CDFHLMSTcdhilms#-.0123456789").find(letter) != std::string::npos) continue;
    const std::string format = std::string("%03") + letter;
    EXPECT_EQ(format_span(format.c_str(), kSample), format) << byte;
  }
  EXPECT_EQ(format_span("%", kSample), "%");
  EXPECT_EQ(format_span("%5-D", kSample), "%5-D");
}

TEST(RealTimeSpan, TextsAreBounded) {
  EXPECT_EQ(format_span(std::string(300, 'x').c_str(), 0), std::string(241, 'x'));
  EXPECT_EQ(format_span((std::string(240, 'x') + "%F").c_str(), 0), std::string(240, 'x') + "0 days 0 hours ");
  EXPECT_EQ(format_span("%9999D", 0).size(), 255U);
  EXPECT_EQ(CRealTimeSpan(1).Format(nullptr), "");
}

TEST(RealTimeSpan, SecondsBecomeTicks) {
  EXPECT_EQ(CRealTimeSpan(183845).Format("%F"), "2 days 3 hours 4 minutes 5 seconds 0 milliseconds");
  EXPECT_EQ(CRealTimeSpan(-1).Format("%L"), "-1000");
  EXPECT_EQ(CRealTimeSpan(2147483647L).Format("%S"), "2147483647");
}

TEST(RealTimeSpan, SecondsBeyondTheCountWrap) {
  const auto wrapped = static_cast<std::int64_t>(static_cast<std::uint64_t>(LONG_MAX) * 10000000U);
  EXPECT_EQ(CRealTimeSpan(LONG_MAX).Format("%L"), format_span("%L", wrapped));
}

TEST(RealTimeSpan, AProductMultipliesTheTickCounts) {
  EXPECT_EQ((CRealTimeSpan(1) * CRealTimeSpan(1)).Format("%S"), "10000000");
  EXPECT_EQ((CRealTimeSpan(3) * CRealTimeSpan(-2)).Format("%S"), "-60000000");
  EXPECT_EQ((CRealTimeSpan(3) * CRealTimeSpan(0)).Format("%L"), "0");
}

TEST(RealTimeSpan, AProductBeyondTheCountWraps) {
  const std::uint64_t ticks = std::uint64_t{86400} * 10000000;
  const auto wrapped = static_cast<std::int64_t>(ticks * ticks);
  EXPECT_EQ((CRealTimeSpan(86400) * CRealTimeSpan(86400)).Format("%L"), format_span("%L", wrapped));
}

TEST(RealTimeSpan, TimeTimeIsTheTimeOfDayOn2000_01_01) {
  const struct {
    const char* zone;
    long seconds;
    std::time_t time;
  } cases[] = {{"UTC", 0, 946684800},
               {"UTC", 86399, 946771199},
               {"UTC", 86400, 946684800},
               {"UTC", 183845, 946684800 + 11045},
               {"UTC", -60, 946684740},
               {"Asia/Kolkata", 3600, 946684800 - 19800 + 3600},
               {"Europe/Amsterdam", 3600, 946684800},
               {"Australia/Sydney", 3600, 946684800 - 39600 + 3600}};
  for (const auto& c : cases) {
    const InZone zone(c.zone);
    EXPECT_EQ(CRealTimeSpan(c.seconds).GetTimeTime(), c.time) << c.zone << " " << c.seconds;
  }
}

TEST(RealTimeSpan, PartsAddUpToTheTotalAtRandomLengths) {
  std::mt19937_64 random(100);
  for (int round = 0; round < 20000; ++round) {
    const auto ticks = static_cast<std::int64_t>(random());
    long long days = 0, hours = 0, minutes = 0, seconds = 0, milliseconds = 0, total = 0;
    const std::string text = format_span("%d %h %m %s %l %L", ticks);
    ASSERT_EQ(std::sscanf(text.c_str(), "%20lld %3lld %3lld %3lld %4lld %20lld", &days, &hours, &minutes, &seconds,
                          &milliseconds, &total),
              6);
    ASSERT_EQ((((days * 24 + hours) * 60 + minutes) * 60 + seconds) * 1000 + milliseconds, total) << ticks;
    ASSERT_EQ(total, ticks / kMillisecond) << ticks;
  }
}

}  // namespace
}  // namespace vexa
