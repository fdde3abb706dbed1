// SPDX-License-Identifier: Apache-2.0
#include "transport/wire/http_answer.h"

#include <gtest/gtest.h>
#include <stdlib.h>

#include <climits>
#include <clocale>
#include <cstdlib>

#include "tests/support/temporary_folder.h"

namespace vexa {
namespace {

TEST(HeaderLength, CountsUpToTheFirstBlankLine) {
  const struct {
    std::string_view received;
    std::size_t length;
  } cases[] = {{"", 0},
               {"HTTP/1.0 200 OK\r\n", 0},
               {"HTTP/1.0 200 OK\r\n\r\n", 19},
               {"HTTP/1.0 200 OK\r\n\r\nbody\r\n\r\n", 19},
               {"HTTP/1.0 200 OK\n\nbody", 17},
               {"\r\n\r\n", 4},
               {"\n\n", 2},
               {"\n\r\n", 0},
               {"\r\n\r", 0}};
  for (const auto& c : cases) EXPECT_EQ(header_length(c.received), c.length) << c.received;
}

TEST(HeaderLength, LooksForCarriageReturnsFirst) { EXPECT_EQ(header_length("a\n\nb\r\n\r\nc"), 8U); }

TEST(HeaderLength, EndsItsSearchAtANul) {
  EXPECT_EQ(header_length(std::string_view("HTTP\0\r\n\r\n", 9)), 0U);
  EXPECT_EQ(header_length(std::string_view("a\r\n\r\n\0b", 7)), 5U);
}

TEST(ParseStatusLine, ReadsNumberAndReason) {
  const struct {
    const char* text;
    int status;
    const char* reason;
  } cases[] = {{"HTTP/1.0 200 OK\r\n\r\n", 200, "OK"},
               {"HTTP/1.1 204 No Content\r\nServer: x", 204, "No Content"},
               {"HTTP/1.0 401 Unauthorized", 401, "Unauthorized"},
               {"HTTP/1.0   503    Try later\n", 503, "Try later"},
               {"HTTP/9 7 x", 7, "x"},
               {"HTTP/ 1.0 200 OK", 200, "OK"},
               {"HTTP/1.0 -5 x", -5, "x"},
               {"HTTP/1.0 +200 x", 200, "x"},
               {"HTTP/1.0 200OK", 200, "OK"},
               {"HTTP/1.0\r\n200\r\nOK", 200, "OK"},
               {"HTTP/1.0 99999999999 big", INT_MAX, "big"},
               {"HTTP/1.0 -99999999999999999999999 small", INT_MIN, "small"}};
  for (const auto& c : cases) {
    const auto line = parse_status_line(c.text, "HTTP/");
    ASSERT_TRUE(line) << c.text;
    EXPECT_EQ(line->status, c.status) << c.text;
    EXPECT_EQ(line->reason, c.reason) << c.text;
  }
}

TEST(ParseStatusLine, NeedsBothNumberAndReason) {
  for (const char* text :
       {"", "HTTP/", "HTTP/1.0", "HTTP/1.0 ", "HTTP/1.0 OK", "HTTP/1.0 200", "HTTP/1.0 200 ", "HTTP/1.0 200\r\n\r\n",
        "HTTP/x 200 OK", "http/1.0 200 OK", " HTTP/1.0 200 OK", "RTSP/1.0 200 OK", "200 OK", "HTTP/1.0 200 ^"}) {
    EXPECT_FALSE(parse_status_line(text, "HTTP/")) << text;
  }
}

TEST(ParseStatusLine, TakesTheNextLineForAMissingReason) {
  const auto line = parse_status_line("HTTP/1.0 200\r\nServer: camera\r\n\r\n", "HTTP/");
  ASSERT_TRUE(line);
  EXPECT_EQ(line->status, 200);
  EXPECT_EQ(line->reason, "Server: camera");
}

TEST(ParseStatusLine, EndsTheReasonAtACaret) {
  EXPECT_EQ(parse_status_line("HTTP/1.0 404 Not^Found\r\n", "HTTP/")->reason, "Not");
}

TEST(ParseStatusLine, ReadsNothingAfterANul) {
  EXPECT_FALSE(parse_status_line(std::string_view("HTTP/1.0 200\0 OK", 16), "HTTP/"));
  EXPECT_EQ(parse_status_line(std::string_view("HTTP/1.0 200 O\0K", 16), "HTTP/")->reason, "O");
}

TEST(ParseStatusLine, KeepsALongReasonTo1023Characters) {
  for (const std::size_t length : {1022U, 1023U, 1024U, 9000U}) {
    const auto line = parse_status_line("HTTP/1.0 500 " + std::string(length, 'r'), "HTTP/");
    ASSERT_TRUE(line);
    EXPECT_EQ(line->reason, std::string(std::min<std::size_t>(length, 1023), 'r'));
  }
}

TEST(ParseStatusLine, ReadsRtspAlike) {
  EXPECT_EQ(parse_status_line("RTSP/1.0 454 Session Not Found\r\n", "RTSP/")->status, 454);
  EXPECT_FALSE(parse_status_line("HTTP/1.0 200 OK", "RTSP/"));
}

/// Has a locale made whose decimal point is a comma, from definitions that stand here, and switches the process to it.
bool switch_to_commas(const vexa_test::TemporaryFolder& folder) {
  const std::string source = folder.make_file("source",
                                              "comment_char %\nescape_char /\nLC_NUMERIC\n"
                                              "decimal_point \"<U002C>\"\nthousands_sep \"\"\ngrouping -1\n"
                                              "END LC_NUMERIC\n");
  const std::string command = "localedef --no-archive -c -i " + source + " " + folder / "xx_XX" + " 2>/dev/null";
  static_cast<void>(std::system(command.c_str()));
  setenv("LOCPATH", folder.path().c_str(), 1);
  return std::setlocale(LC_NUMERIC, "xx_XX") != nullptr && *std::localeconv()->decimal_point == ',';
}

TEST(ParseStatusLine, ReadsTheVersionWhateverTheHostsDecimalPoint) {
  const vexa_test::TemporaryFolder folder;
  if (!switch_to_commas(folder)) GTEST_SKIP() << "no locale could be made";
  const auto line = parse_status_line("HTTP/1.0 200 OK\r\n", "HTTP/");
  std::setlocale(LC_NUMERIC, "C");
  unsetenv("LOCPATH");
  ASSERT_TRUE(line);
  EXPECT_EQ(line->status, 200);
  EXPECT_EQ(line->reason, "OK");
}

TEST(CgiValue, GoesUpToTheNextPairOrTheEnd) {
  const struct {
    std::string_view answer, key, value;
  } cases[] = {{"ModelName=X1&Serial=7", "ModelName=", "X1"},
               {"ModelName=X1&Serial=7", "Serial=", "7"},
               {"A=&B=1", "A=", ""},
               {"A=", "A=", ""},
               {"A=1&A=2", "A=", "1"},
               {"A=x=y&B=1", "A=", "x=y"},
               {"A=b%20c", "A=", "b%20c"},
               {"A= b ", "A=", " b "},
               {"A=1\r\n&B=2", "A=", "1\r\n"}};
  for (const auto& c : cases) EXPECT_EQ(cgi_value(c.answer, c.key), c.value) << c.answer << " " << c.key;
}

TEST(CgiValue, IsNoneWithoutTheKey) {
  for (const char* answer : {"", "B=1", "a=1", "A", "&&&&"}) EXPECT_EQ(cgi_value(answer, "A="), std::nullopt) << answer;
}

TEST(CgiValue, FindsAKeyInsideALongerOne) {
  EXPECT_EQ(cgi_value("DigitalZoom=on&Zoom=2", "Zoom="), "on");
  EXPECT_EQ(cgi_value("Zoom=2&DigitalZoom=on", "Zoom="), "2");
}

TEST(CgiValue, IsEveryPrefixOfACutAnswer) {
  constexpr std::string_view kAnswer = "Serial=1234&MacAddress=00:11";
  for (std::size_t length = 0; length <= kAnswer.size(); ++length) {
    const std::string_view cut = kAnswer.substr(0, length);
    if (length < 7) {
      EXPECT_EQ(cgi_value(cut, "Serial="), std::nullopt) << length;
    } else {
      EXPECT_EQ(cgi_value(cut, "Serial="), kAnswer.substr(7, std::min<std::size_t>(length - 7, 4))) << length;
    }
  }
}

TEST(AnnouncedLength, IsTheNumberAfterItsKey) {
  const struct {
    const char* header;
    std::optional<int> length;
  } cases[] = {{"DataLen: 1234\r\n\r\n", 1234},
               {"--part\r\nContent-Type: image/jpeg\r\nDataLen:1234\r\n\r\n", 1234},
               {"DataLen: \r\n\t 7 bytes", 7},
               {"DataLen: +8", 8},
               {"DataLen: 0", 0},
               {"DataLen: 2147483647", INT_MAX},
               {"DataLen: 99999999999999999999", INT_MAX},
               {"XDataLen: 5", 5},
               {"DataLen: 5 DataLen: 6", 5},
               {"DataLen: x DataLen: 6", std::nullopt},
               {"DataLen: -1", std::nullopt},
               {"DataLen: -99999999999999999999", std::nullopt},
               {"DataLen:", std::nullopt},
               {"DataLen: -", std::nullopt},
               {"DataLen", std::nullopt},
               {"datalen: 5", std::nullopt},
               {"Content-Length: 5", std::nullopt},
               {"", std::nullopt}};
  for (const auto& c : cases) EXPECT_EQ(announced_length(c.header), c.length) << c.header;
}

}  // namespace
}  // namespace vexa
