#include "host/cgi_log/cgi_log_rows.h"

#include <gtest/gtest.h>

namespace vexa::host {
namespace {

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
