// SPDX-License-Identifier: Apache-2.0
// The CGI log read back: lines, banners, and what belongs together.
#include "host/cgi_log/cgi_log.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <vector>

namespace vexa::host {
namespace {

using std::chrono::milliseconds;
using Direction = CgiLogLine::Direction;

const std::string kRule(103, '-');
const std::string kOpening = "\n" + kRule + "\n21-11-2026 03:40:51.000 LogFile Opened. ";
const std::string kClosing = "\n21-11-2026 03:40:59.000\tLogFile Closed\n" + kRule + "\n";

std::string to(const std::string& path, const std::string& clock = "03:40:51.100") {
  return "\r\n21-11-2026\t" + clock + "\tCGI\tTo\t" + path;
}

std::string from(const std::string& answer, const std::string& clock = "03:40:51.123") {
  return "\r\n21-11-2026\t" + clock + "\tCGI\tFrom\t" + answer;
}

// An exchange in brief: "path>status reason", with "-" for what there is not.
std::string brief(const CgiExchange& exchange) {
  std::string text = exchange.request ? exchange.request->path : "-";
  if (!exchange.answer) return text + ">-";
  const auto& status = exchange.answer->status;
  return text + ">" + (status ? std::to_string(*status) : "-") + " " + exchange.answer->reason;
}

class CgiLog : public testing::Test {
 protected:
  std::vector<std::string> read(const std::string& bytes) {
    reader_.feed(bytes);
    reader_.finish();
    return exchanges_;
  }

  std::vector<std::string> exchanges_;
  std::vector<std::optional<milliseconds>> durations_;
  CgiLogReader reader_{[this](const CgiExchange& exchange) {
    exchanges_.push_back(brief(exchange));
    durations_.push_back(exchange.duration());
  }};
};

TEST(CgiLogLine, HoldsTimeDirectionAndMessage) {
  const auto line = parse_cgi_log_line("29-02-2028\t23:59:58.007\tCGI\tFrom\t200 OK\tand\tmore");
  ASSERT_TRUE(line);
  using namespace std::chrono;
  EXPECT_EQ(line->time, local_days{2028y / February / 29} + 23h + 59min + 58s + 7ms);
  EXPECT_EQ(line->direction, Direction::kFrom);
  EXPECT_EQ(line->message, "200 OK\tand\tmore");
}

TEST(CgiLogLine, MayHaveAnEmptyMessage) {
  const auto line = parse_cgi_log_line("01-01-2026\t00:00:00.000\tCGI\tTo\t");
  ASSERT_TRUE(line);
  EXPECT_EQ(line->direction, Direction::kTo);
  EXPECT_EQ(line->message, "");
}

TEST(CgiLogLine, IsNoOtherText) {
  const char* const texts[] = {"",
                               "01-01-2026\t00:00:00.000\tCGI\t",
                               "01-01-2026\t00:00:00.000\tCGI\tTo",
                               "01-01-2026\t00:00:00.000\tCGI\tto\t/a",
                               "01-01-2026\t00:00:00.000\tCGI\tOff\t/a",
                               "01-01-2026 00:00:00.000\tCGI\tTo\t/a",
                               "1-01-2026\t00:00:00.000\tCGI\tTo\t/a",
                               "00-01-2026\t00:00:00.000\tCGI\tTo\t/a",
                               "32-01-2026\t00:00:00.000\tCGI\tTo\t/a",
                               "29-02-2026\t00:00:00.000\tCGI\tTo\t/a",
                               "01-13-2026\t00:00:00.000\tCGI\tTo\t/a",
                               "01-00-2026\t00:00:00.000\tCGI\tTo\t/a",
                               "01-01-2026\t24:00:00.000\tCGI\tTo\t/a",
                               "01-01-2026\t00:60:00.000\tCGI\tTo\t/a",
                               "01-01-2026\t00:00:60.000\tCGI\tTo\t/a",
                               "01-01-2026\t00:00:00.00x\tCGI\tTo\t/a",
                               "x01-01-2026\t00:00:00.000\tCGI\tTo\t/a"};
  for (const char* text : texts) EXPECT_FALSE(parse_cgi_log_line(text)) << text;
}

TEST(CgiLogLine, NoPartOfALineIsOne) {
  const std::string line = "01-01-2026\t00:00:00.000\tCGI\tTo\t";
  for (std::size_t length = 0; length < line.size(); ++length) {
    EXPECT_FALSE(parse_cgi_log_line(line.substr(0, length))) << length;
  }
}

TEST(CgiAnswer, IsStatusAndReason) {
  const struct {
    const char* message;
    std::optional<int> status;
    const char* reason;
  } cases[] = {{"200 OK", 200, "OK"},
               {"204 No Content", 204, "No Content"},
               {"-1 odd", -1, "odd"},
               {"2147483647 most", 2147483647, "most"},
               {"2147483648 more", std::nullopt, "2147483648 more"},
               {"200", 200, ""},
               {"200 ", 200, ""},
               {"200OK", std::nullopt, "200OK"},
               {"OK", std::nullopt, "OK"},
               {"", std::nullopt, ""}};
  for (const auto& row : cases) {
    const CgiAnswer answer = to_answer({{}, Direction::kFrom, row.message});
    EXPECT_EQ(answer.status, row.status) << row.message;
    EXPECT_EQ(answer.reason, row.reason) << row.message;
  }
}

TEST_F(CgiLog, PairsARequestWithTheNextAnswer) {
  EXPECT_THAT(read(kOpening + to("/a?x=1") + from("200 OK") + to("/b") + from("404 Not Found") + kClosing),
              testing::ElementsAre("/a?x=1>200 OK", "/b>404 Not Found"));
  EXPECT_THAT(durations_, testing::Each(std::optional(milliseconds(23))));
  EXPECT_EQ(reader_.lines(), 4u);
  EXPECT_EQ(reader_.foreign_lines(), 0u);
  EXPECT_TRUE(reader_.saw_banner());
}

TEST_F(CgiLog, ARequestThatAnotherFollowsIsUnanswered) {
  EXPECT_THAT(read(to("/a") + to("/b") + from("200 OK")), testing::ElementsAre("/a>-", "/b>200 OK"));
  EXPECT_EQ(durations_.front(), std::nullopt);
}

TEST_F(CgiLog, ARequestAtTheEndIsUnanswered) { EXPECT_THAT(read(to("/a")), testing::ElementsAre("/a>-")); }

TEST_F(CgiLog, AnAnswerWithoutARequestIsARowOfItsOwn) {
  EXPECT_THAT(read(from("200 OK") + from("204 No")), testing::ElementsAre("->200 OK", "->204 No"));
  EXPECT_THAT(durations_, testing::Each(std::optional<milliseconds>()));
}

TEST_F(CgiLog, AClockPutBackLeavesNoDuration) {
  read(to("/a", "03:00:00.000") + from("200 OK", "02:59:59.999"));
  EXPECT_EQ(durations_.front(), std::nullopt);
}

TEST_F(CgiLog, AnAnswerAfterABannerBelongsToTheRequestBeforeIt) {
  EXPECT_THAT(read(kOpening + to("/a") + kClosing + kOpening + from("200 OK")), testing::ElementsAre("/a>200 OK"));
}

TEST_F(CgiLog, AFileCutShortByACrashIsContinued) {
  EXPECT_THAT(read(kOpening + to("/a") + kOpening + to("/b") + from("200 OK")),
              testing::ElementsAre("/a>-", "/b>200 OK"));
}

TEST_F(CgiLog, ALineFeedWithinAMessageBeginsNoLine) {
  EXPECT_THAT(read(to("/a") + from("500 no\n21-11-2026\t03:40:51.100\tCGI\tTo\t/forged")),
              testing::ElementsAre("/a>500 no"));
  EXPECT_EQ(reader_.foreign_lines(), 1u);
}

TEST_F(CgiLog, CountsWhatIsNoLine) {
  EXPECT_THAT(read("rubbish" + to("/a") + "\r\n\r\nmore" + from("200 OK")), testing::ElementsAre("/a>200 OK"));
  EXPECT_EQ(reader_.foreign_lines(), 2u);
  EXPECT_FALSE(reader_.saw_banner());
}

TEST_F(CgiLog, BytesOfAllKindsAreReadWithoutHarm) {
  std::string bytes;
  for (unsigned i = 0; i < 100000; ++i) bytes += static_cast<char>((i * 2654435761u) >> 24);
  EXPECT_THAT(read(bytes), testing::IsEmpty());
  EXPECT_EQ(reader_.lines(), 0u);
  EXPECT_GT(reader_.foreign_lines(), 0u);
}

TEST_F(CgiLog, ALongLineIsCutAndTheNextIsRead) {
  const std::size_t before_message = to("").size() - 2;
  const std::string fits(CgiLogReader::kLongestLine - before_message, 'x');
  for (const char* more : {"", "y", "yyyyyyyyyyyyyyyyyyyyyyyyyyyyyyyy"}) {
    read(to(fits + more) + from("200 OK"));
  }
  ASSERT_EQ(exchanges_.size(), 3u);
  EXPECT_EQ(exchanges_[0], fits + ">200 OK");
  EXPECT_EQ(exchanges_[1], fits + "...>200 OK");
  EXPECT_EQ(exchanges_[2], fits + "...>200 OK");
}

TEST_F(CgiLog, PiecesOfAnySizeReadAlike) {
  const std::string bytes = kOpening + to("/a\r?") + from("200 OK") + to("/b") + kClosing + kOpening + to("/c");
  const std::vector<std::string> whole = {"/a\r?>200 OK", "/b>-", "/c>-"};
  for (std::size_t at = 0; at <= bytes.size(); ++at) {
    exchanges_.clear();
    CgiLogReader reader([this](const CgiExchange& exchange) { exchanges_.push_back(brief(exchange)); });
    reader.feed(bytes.substr(0, at));
    reader.feed(bytes.substr(at));
    reader.finish();
    EXPECT_EQ(exchanges_, whole) << at;
  }
}

TEST_F(CgiLog, ASettledLineIsHandedOutBeforeTheNextBegins) {
  reader_.feed(to("/a") + from("200 OK"));
  EXPECT_THAT(exchanges_, testing::IsEmpty());
  reader_.settle();
  EXPECT_THAT(exchanges_, testing::ElementsAre("/a>200 OK"));
  EXPECT_THAT(read(to("/b") + from("204 No")), testing::ElementsAre("/a>200 OK", "/b>204 No"));
}

TEST_F(CgiLog, ABannerAfterASettledLineIsNoLine) {
  reader_.feed(to("/a"));
  reader_.settle();
  EXPECT_THAT(read(kClosing + kOpening + from("200 OK")), testing::ElementsAre("/a>200 OK"));
  EXPECT_EQ(reader_.foreign_lines(), 0u);
}

TEST_F(CgiLog, AnAnswerInTheNextFileBelongsToTheRequestBeforeIt) {
  reader_.feed(kOpening + to("/a") + kClosing);
  reader_.begin_file();
  EXPECT_THAT(read(kOpening + from("200 OK")), testing::ElementsAre("/a>200 OK"));
}

using namespace std::chrono_literals;

constexpr LogTime kTime = std::chrono::local_days{std::chrono::year{2026} / 3 / 4} + 5h + 6min + 7s + 8ms;

CgiExchange exchange(const std::string& path, const std::string& reason) {
  return {CgiRequest{kTime, path}, CgiAnswer{kTime + 1234ms, 200, reason}};
}

TEST(CgiLogTable, AlignsItsColumns) {
  const Redactor none;
  EXPECT_EQ(table_head(),
            "Time                         ms  Status  Request                                   Answer\n");
  EXPECT_EQ(table_row(exchange("/a", "OK"), none),
            "2026-03-04 05:06:07.008    1234     200  /a                                        OK\n");
  EXPECT_EQ(table_row({CgiRequest{kTime, "/a"}, std::nullopt}, none),
            "2026-03-04 05:06:07.008       -       -  /a                                        no answer\n");
  EXPECT_EQ(table_row({std::nullopt, CgiAnswer{kTime, std::nullopt, "odd"}}, none),
            "2026-03-04 05:06:07.008       -       -  -                                         odd\n");
}

TEST(CgiLogTable, ARowIsOneLineWhateverTheCameraSends) {
  const std::string row = table_row(exchange("/\xff\xc2", "a\r\nb\x1b[2J\xc2\x9b"), Redactor());
  EXPECT_EQ(row.find('\n'), row.size() - 1);
  EXPECT_TRUE(row.ends_with("  a\\x0d\\x0ab\\x1b[2J\\xc2\x9b\n")) << row;
}

TEST(CgiLogTable, HidesThePassword) {
  const std::string row = table_row(exchange("/a?p=swordfish", "no swordfish"), Redactor({"operator", "swordfish"}));
  EXPECT_EQ(row, "2026-03-04 05:06:07.008    1234     200  /a?p=***                                  no ***\n");
}

TEST(CgiLogJson, HasAValueOrNullForEachName) {
  const Redactor none;
  EXPECT_EQ(json_row(exchange("/a", "OK"), none),
            R"({"time":"2026-03-04T05:06:07.008","path":"/a","status":200,"reason":"OK","milliseconds":1234})"
            "\n");
  EXPECT_EQ(json_row({CgiRequest{kTime, "/a"}, std::nullopt}, none),
            R"({"time":"2026-03-04T05:06:07.008","path":"/a","status":null,"reason":null,"milliseconds":null})"
            "\n");
  EXPECT_EQ(json_row({std::nullopt, CgiAnswer{kTime, std::nullopt, "odd"}}, none),
            R"({"time":"2026-03-04T05:06:07.008","path":null,"status":null,"reason":"odd","milliseconds":null})"
            "\n");
}

TEST(CgiLogJson, EscapesControlsAndReplacesWhatIsNoUtf8) {
  EXPECT_NE(json_row(exchange("/a", "\x1b\x7f\xc2\x9b\xff\r\n"), Redactor())
                .find(R"("reason":"\u001b\u007f\u009b\ufffd\r\n")"),
            std::string::npos);
}

TEST(CgiLogJson, HidesThePassword) {
  const std::string row = json_row(exchange("/a?p=swordfish", "no swordfish"), Redactor({"operator", "swordfish"}));
  EXPECT_EQ(row.find("swordfish"), std::string::npos) << row;
}

}  // namespace
}  // namespace vexa::host
