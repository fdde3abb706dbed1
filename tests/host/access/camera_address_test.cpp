// SPDX-License-Identifier: Apache-2.0
#include "host/access/camera_address.h"

#include <gtest/gtest.h>

namespace vexa::host {
namespace {

TEST(CameraAddressText, ReadsHostAndPort) {
  const struct {
    const char* text;
    const char* host;
    int port;
  } cases[] = {{"192.168.0.100", "192.168.0.100", 80},
               {"cam-1_a.example:8080", "cam-1_a.example", 8080},
               {"c:1", "c", 1},
               {"c:65535", "c", 65535}};
  for (const auto& row : cases) {
    SCOPED_TRACE(row.text);
    const auto result = parse_camera_address(row.text);
    ASSERT_TRUE(result);
    EXPECT_EQ(result->host, row.host);
    EXPECT_EQ(result->port, row.port);
  }
}

TEST(CameraAddressText, TakesAHostOfAtMost253Characters) {
  EXPECT_TRUE(parse_camera_address(std::string(253, 'a')));
  EXPECT_FALSE(parse_camera_address(std::string(254, 'a')));
}

TEST(CameraAddressText, RefusesEverythingElseWithoutRepeatingIt) {
  for (const char* text :
       {"", ":80", "cam:", "cam:0", "cam:65536", "cam:80x", "cam: 80", "cam:+80", "cam:99999999999", "[::1]:80", "::1",
        "hunter2@cam", "admin:hunter2@cam:80", "http://cam/", "ca m", "cam\r\n", "c\xc3\xa4m"}) {
    SCOPED_TRACE(text);
    const auto result = parse_camera_address(text);
    ASSERT_FALSE(result);
    EXPECT_EQ(result.error().code, ExitCode::kUsage);
    EXPECT_EQ(result.error().text.find("hunter2"), std::string::npos);
  }
}

TEST(CameraAddressText, IsWrittenWithItsPort) { EXPECT_EQ(to_string({"cam", 80}), "cam:80"); }

TEST(CameraName, ThatCannotBeFoundIsAProblem) {
  EXPECT_FALSE(check_name({"127.0.0.1", 80}));
  const auto problem = check_name({"no-such-camera.invalid", 80});
  ASSERT_TRUE(problem);
  EXPECT_EQ(problem->code, ExitCode::kUnreachable);
}

}  // namespace
}  // namespace vexa::host
