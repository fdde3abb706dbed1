// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/control_port.h"

#include <gtest/gtest.h>

#include <string>

namespace vexa::camera {
namespace {

std::string_view refusal_of(const std::string& fields) {
  const auto request = parse_head("GET /walk HTTP/1.1\r\n" + fields + "\r\n");
  return request ? control_refusal(*request) : "no request";
}

TEST(ControlPort, ItsOwnPageAndProgramsAreTaken) {
  for (const char* fields :
       {"", "Host: 127.0.0.1:8080\r\n", "Host: localhost:8080\r\n", "Host: localhost\r\nSec-Fetch-Site: none\r\n",
        "Host: 127.0.0.1:8080\r\nOrigin: http://127.0.0.1:8080\r\nSec-Fetch-Site: same-origin\r\n"}) {
    EXPECT_EQ(refusal_of(fields), "") << fields;
  }
}

TEST(ControlPort, AnotherHostsNameIsRefused) {
  for (const char* host : {"evil.example", "evil.example:8080", "127.0.0.1.evil.example", "localhost.evil.example:80",
                           "[::1]:8080", "192.0.2.1"}) {
    EXPECT_EQ(refusal_of("Host: " + std::string(host) + "\r\n"), "421 Misdirected Request") << host;
  }
}

TEST(ControlPort, APageOfAnotherOriginIsRefused) {
  const std::string host = "Host: 127.0.0.1:8080\r\n";
  for (const char* field :
       {"Sec-Fetch-Site: cross-site\r\n", "Sec-Fetch-Site: same-site\r\n", "Origin: http://evil.example\r\n",
        "Origin: http://127.0.0.1:8081\r\n", "Origin: null\r\n"}) {
    EXPECT_EQ(refusal_of(host + field), "403 Forbidden") << field;
  }
}

TEST(ControlPort, AnAnswerHasItsLengthAndStaysOutOfOtherPages) {
  const std::string answer = control_answer("200 OK", "text/plain", "abc");
  EXPECT_EQ(answer.substr(0, 17), "HTTP/1.0 200 OK\r\n");
  for (const char* line : {"\r\nContent-Type: text/plain; charset=utf-8\r\n", "\r\nContent-Length: 3\r\n",
                           "\r\nCross-Origin-Resource-Policy: same-origin\r\n", "frame-ancestors 'none'\r\n"}) {
    EXPECT_NE(answer.find(line), std::string::npos) << line;
  }
  EXPECT_EQ(answer.substr(answer.size() - 7), "\r\n\r\nabc");
  EXPECT_EQ(control_answer("204 No Content"), "HTTP/1.0 204 No Content\r\n\r\n");
}

}  // namespace
}  // namespace vexa::camera
