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

}  // namespace
}  // namespace vexa
