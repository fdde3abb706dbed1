// SPDX-License-Identifier: Apache-2.0
#include "transport/wire/rtsp_answer.h"

#include <gtest/gtest.h>

#include <climits>
#include <string>

namespace vexa {
namespace {

using Found = RtpClock::Found;

constexpr std::string_view kDescription =
    "RTSP/1.0 200 OK\r\nCSeq: 1\r\nContent-Type: application/sdp\r\n\r\n"
    "v=0\r\na=range:clock=20240131T235959.250Z-\r\nm=video 0 RTP/AVP 96\r\na=rtpmap:96 H264/90000\r\n\r\n";

TEST(RtpClock, IsTheNumberAfterTheFirstSlash) {
  const struct {
    std::string_view answer;
    int rate;
  } cases[] = {{"a=rtpmap:96 H264/90000\r\n", 90000}, {"rtpmap:/1", 1},
               {"rtpmap:26 JPEG/ 90000", 90000},      {"rtpmap:x/-5", -5},
               {"rtpmap:x/90000/2", 90000},           {"rtpmap:96 H264\r\na=fmtp:1/8000", 8000},
               {"rtpmap:x/99999999999", INT_MAX}};
  for (const auto& c : cases) {
    const RtpClock clock = rtp_clock(c.answer);
    EXPECT_EQ(clock.found, Found::kRate) << c.answer;
    EXPECT_EQ(clock.rate, c.rate) << c.answer;
  }
}

TEST(RtpClock, ReportsWhatIsMissing) {
  const struct {
    std::string_view answer;
    Found found;
  } cases[] = {{"", Found::kNoRtpmap},
               {"a=rtpma:96 H264/90000", Found::kNoRtpmap},
               {"1/2", Found::kNoRtpmap},
               {"rtpmap:", Found::kNoSlash},
               {"/1 rtpmap:96", Found::kNoSlash},
               {"rtpmap:96 H264/", Found::kNoNumber},
               {"rtpmap:96 H264/x", Found::kNoNumber},
               {"rtpmap:96 H264/x/1", Found::kNoNumber},
               {std::string_view("rtpmap:96 H264\0/9", 17), Found::kNoSlash}};
  for (const auto& c : cases) EXPECT_EQ(rtp_clock(c.answer).found, c.found) << c.answer;
}

TEST(RtpClock, TakesTheFirstRtpmapWhateverItsTrack) {
  EXPECT_EQ(rtp_clock("a=rtpmap:0 PCMU/8000\r\na=rtpmap:96 H264/90000\r\n").rate, 8000);
}

TEST(RangeClockText, IsWhatFollowsTheKey) {
  EXPECT_EQ(range_clock_text("a=range:clock=2024Z-\r\n"), "2024Z-\r\n");
  EXPECT_EQ(range_clock_text("clock="), "");
  EXPECT_EQ(range_clock_text("a=range:npt=0-"), std::nullopt);
  EXPECT_EQ(range_clock_text(std::string_view("\0clock=1", 8)), std::nullopt);
}

TEST(SessionNumber, IsASignedDecimal) {
  const struct {
    const char* answer;
    int number;
  } cases[] = {{"RTSP/1.0 200 OK\r\nSession: 12345678;timeout=60\r\n\r\n", 12345678},
               {"Session:7", 7},
               {"Session: \t 7\r\n", 7},
               {"Session:\r\n 7", 7},
               {"Session: -3", -3},
               {"Session: 12AB", 12},
               {"Session: 2147483647", INT_MAX},
               {"Session: 2147483648", INT_MAX},
               {"Session: 1\r\nSession: 2", 1},
               {"X-Session: 5", 5}};
  for (const auto& c : cases) EXPECT_EQ(session_number(c.answer), c.number) << c.answer;
}

TEST(SessionNumber, IsNoneForOtherIdentifiers) {
  for (const char* answer : {"", "Session", "Session:", "Session: ", "Session: ABCDEF", "Session: ;1", "session: 1",
                             "Session: ABC\r\nSession: 1"}) {
    EXPECT_EQ(session_number(answer), std::nullopt) << answer;
  }
}

TEST(RtspHeaderComplete, SearchesFromFourBytesBeforeTheLatestPeek) {
  const struct {
    std::string_view looked_at;
    std::size_t latest;
    bool complete;
  } cases[] = {{"", 0, false},
               {"abc\r\n\r", 0, false},
               {"\r\n\r\n", 0, true},
               {"abc\r\n\r\n", 0, true},
               {"abc\r\n\r\nbody", 0, true},
               // the second look begins at 5; an end in the first look's last four bytes still counts
               {"a\r\n\r\nxyz", 5, true},
               {"\r\n\r\nabcdexyz", 9, false},
               // across the border of two looks
               {"abc\r\n\r\nxyz", 5, true},
               // three bytes in the first look: searched from the second look's beginning only
               {"a\r\n\r\nwxyz", 3, false}};
  for (const auto& c : cases) EXPECT_EQ(rtsp_header_complete(c.looked_at, c.latest), c.complete) << c.looked_at;
}

TEST(RtspHeaderComplete, AlsoLooksAtTheBufferWhereTheLatestLooksLengthEnds) {
  // The second look is 8 bytes long; the four bytes before offset 8 of the buffer are a header end.
  EXPECT_TRUE(rtsp_header_complete("abcd\r\n\r\nabcdefghabcdefgh", 16));
  EXPECT_FALSE(rtsp_header_complete("abcde\r\n\r\nbcdefghabcdefgh", 16));
  // A look of three bytes or less has no such place.
  EXPECT_FALSE(rtsp_header_complete("\r\n\r\nabcdefghabc", 12));
}

TEST(RtspAnswer, IsReadFromEveryCutWithoutHarm) {
  for (std::size_t length = 0; length <= kDescription.size(); ++length) {
    const std::string_view cut = kDescription.substr(0, length);
    const std::size_t header = kDescription.find("\r\n\r\n") + 4;
    EXPECT_EQ(rtsp_header_complete(cut, 0), length >= header) << length;
    const std::size_t rate = kDescription.find("/90000");
    const RtpClock clock = rtp_clock(cut);
    EXPECT_EQ(clock.found == Found::kRate, length >= rate + 2) << length;
    EXPECT_EQ(clock.rate == 90000, length >= rate + 6) << length;
  }
}

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
