#include "transport/wire/range_clock.h"

#include <gtest/gtest.h>

#include <climits>
#include <string>

namespace vexa {
namespace {

constexpr std::int64_t kLastSecondOfJanuary2024 = 1706745599;

TEST(ParseRangeClock, ReadsDateTimeAndFraction) {
  const RangeClock clock = parse_range_clock("20240131T235959.250Z-\r\n");
  EXPECT_TRUE(clock.understood);
  EXPECT_EQ(clock.seconds, kLastSecondOfJanuary2024);
  EXPECT_EQ(clock.micros, 250000);
}

TEST(ParseRangeClock, EndsAtZOrAtTheLinesEnd) {
  for (const std::string end : {"Z", "z", "\r", "\n"}) {
    const RangeClock clock = parse_range_clock("20240131T235959.250" + end);
    EXPECT_TRUE(clock.understood);
    EXPECT_EQ(clock.micros, 250000);
  }
}

TEST(ParseRangeClock, FillsAFractionUpToSixDigits) {
  const struct {
    const char* fraction;
    int micros;
  } cases[] = {{"", 0},          {"1", 100000},     {"12", 120000},     {"123", 123000},
               {"1234", 123400}, {"12345", 123450}, {"123456", 123456}, {"000001", 1},
               {"00001", 10},    {"x", 0},          {"-1", -10000}};
  for (const auto& c : cases) {
    EXPECT_EQ(parse_range_clock("20240131T235959." + std::string(c.fraction) + "Z").micros, c.micros) << c.fraction;
  }
}

TEST(ParseRangeClock, TakesALongerFractionAsItIs) {
  EXPECT_EQ(parse_range_clock("20240131T235959.1234567Z").micros, 1234567);
  EXPECT_EQ(parse_range_clock("20240131T235959.99999999999Z").micros, INT_MAX);
}

TEST(ParseRangeClock, WithoutAFractionGivesNoSecondsAndTakesTheTimeForIt) {
  const RangeClock clock = parse_range_clock("20240131T235959Z");
  EXPECT_TRUE(clock.understood);
  EXPECT_EQ(clock.seconds, std::nullopt);
  EXPECT_EQ(clock.micros, 235959);
}

TEST(ParseRangeClock, WithoutAnEndIsNotUnderstood) {
  EXPECT_FALSE(parse_range_clock("").understood);
  constexpr std::string_view kClock = "20240131T235959.250";
  for (std::size_t length = 0; length <= kClock.size(); ++length) {
    const RangeClock clock = parse_range_clock(kClock.substr(0, length));
    EXPECT_FALSE(clock.understood) << length;
    EXPECT_EQ(clock.seconds.has_value(), length >= 16) << length;
  }
  EXPECT_FALSE(parse_range_clock(std::string_view("2024\0Z", 6)).understood);
}

TEST(ParseRangeClock, ReadsDatesOutsideTheCalendarWithoutHarm) {
  const struct {
    const char* clock;
    std::int64_t seconds;
  } cases[] = {{"19700101T000000.0Z", 0},
               {"20240229T120000.0Z", 1709208000},
               {"20380119T031408.0Z", 2147483648},
               {"19700000T000000.0Z", -86400},    // day 0; month 0 counts as January
               {"19701301T000000.0Z", 31536000},  // month 13: the whole year lies before
               {"T.0Z", -62167305600},            // year 0
               {"20240131T996199.0Z", 1706659200 + 99 * 3600 + 61 * 60 + 99}};
  for (const auto& c : cases) EXPECT_EQ(parse_range_clock(c.clock).seconds, c.seconds) << c.clock;
  for (const char* clock :
       {"99999999999999T99999999999999.0Z", "-99999999999T-99999999.0Z", "TTT...ZZZ", "\x80T\xff.Z"}) {
    EXPECT_TRUE(parse_range_clock(clock).understood) << clock;
  }
}

TEST(ParseRangeClock, ReadsNoNumberLongerThan63Characters) {
  const std::string zeros(56, '0');
  EXPECT_EQ(parse_range_clock(zeros + "19700102T000000.0Z").seconds.value_or(0),
            parse_range_clock("1970010T0.0Z").seconds);
}

}  // namespace
}  // namespace vexa
