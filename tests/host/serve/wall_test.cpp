// SPDX-License-Identifier: Apache-2.0
#include "host/serve/wall.h"

#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

namespace vexa::host {
namespace {

SessionStatus status_of(SessionState state, std::uint32_t attempt = 1, const std::string& why = "") {
  SessionStatus status;
  status.state = state;
  status.attempt = attempt;
  status.why = why;
  return status;
}

void take_picture(WallCamera& camera, std::int64_t arrival, const std::string& bytes = "jpeg", bool is_jpeg = true) {
  SessionFrame frame;
  frame.data = reinterpret_cast<const unsigned char*>(bytes.data());
  frame.length = bytes.size();
  frame.arrival = arrival;
  camera.take_frame(frame, is_jpeg, 1700000000000);
}

TEST(Stale, APictureIsOlderThanTwoSecondsAndTwoIntervals) {
  EXPECT_FALSE(is_stale(2000, 40));
  EXPECT_TRUE(is_stale(2001, 40));
  EXPECT_FALSE(is_stale(10000, 5000));
  EXPECT_TRUE(is_stale(10001, 5000));
}

TEST(WallCamera, IsStaleUntilItsFirstPictureAndWhenNoneFollows) {
  Wall wall;
  WallCamera& camera = wall.add("gate");
  EXPECT_TRUE(camera.stale(0));
  EXPECT_FALSE(camera.age(0));
  take_picture(camera, 1000);
  EXPECT_EQ(camera.age(1500), 500);
  EXPECT_FALSE(camera.stale(3000));
  EXPECT_TRUE(camera.stale(3001));
}

TEST(WallCamera, KeepsTheLatestJpegAndCountsOtherPictures) {
  WallCamera camera("gate");
  take_picture(camera, 1000, "one");
  take_picture(camera, 1040, "two");
  ASSERT_TRUE(camera.picture());
  EXPECT_EQ(*camera.picture(), "two");
  EXPECT_EQ(camera.picture_number(), 2U);
  take_picture(camera, 1080, "h264", false);
  EXPECT_EQ(*camera.picture(), "two");
  EXPECT_EQ(camera.picture_number(), 2U);
  EXPECT_EQ(camera.pictures(), 3U);
  EXPECT_EQ(camera.bytes(), 10U);
}

TEST(WallCamera, ItsRateIsThatOfTheLatestFiveSeconds) {
  WallCamera camera("gate");
  for (std::int64_t at = 0; at <= 10000; at += 100) take_picture(camera, at);
  EXPECT_DOUBLE_EQ(camera.rate(10000), 10);
  EXPECT_DOUBLE_EQ(camera.rate(12500), 5);
  EXPECT_DOUBLE_EQ(camera.rate(15000), 0);
}

TEST(WallCamera, CountsWhenALiveCameraStopsBeingLive) {
  WallCamera camera("gate");
  for (const SessionState state : {SessionState::kConnecting, SessionState::kLive, SessionState::kStalled,
                                   SessionState::kWaiting, SessionState::kLive, SessionState::kLive}) {
    camera.take_status(status_of(state));
  }
  EXPECT_EQ(camera.interruptions(), 1U);
}

TEST(Wall, IsReadyWhenEachCameraHasBeenTried) {
  Wall wall;
  WallCamera& first = wall.add("a");
  WallCamera& second = wall.add("b");
  EXPECT_FALSE(wall.ready());
  first.take_status(status_of(SessionState::kLive));
  second.take_status(status_of(SessionState::kConnecting));
  EXPECT_FALSE(wall.ready());
  second.take_status(status_of(SessionState::kWaiting));
  EXPECT_TRUE(wall.ready());
  second.take_status(status_of(SessionState::kConnecting, 2));
  EXPECT_TRUE(wall.ready());
}

TEST(Wall, ReportsStatesAsJsonWhateverTheTextsHold) {
  Wall wall;
  const std::string hostile = "<script>\"\n\x1b\xff";
  wall.add("gate").take_status(status_of(SessionState::kRefused, 3, hostile));
  const auto states = nlohmann::json::parse(wall.states(0));
  const auto& camera = states["cameras"][0];
  EXPECT_EQ(camera["name"], "gate");
  EXPECT_EQ(camera["state"], "refused");
  EXPECT_EQ(camera["why"], "<script>\"\n\x1b\xef\xbf\xbd");
  EXPECT_EQ(camera["ageMilliseconds"], nullptr);
  EXPECT_EQ(camera["attempt"], 3);
}

TEST(Metrics, HaveTheFormThatTheTextFormatAsksFor) {
  Wall wall;
  take_picture(wall.add("gate"), 1000);
  const std::string text = wall.metrics(Wall::MetricsFormat::kPrometheus, {.viewers = 2}, "1.2.3");
  EXPECT_EQ(text.substr(0, 63), "# HELP vexa_build_info The version of vexactl.\n# TYPE vexa_buil");
  for (const char* part :
       {"\nvexa_build_info{version=\"1.2.3\"} 1\n", "\n# TYPE vexa_camera_pictures_total counter\n",
        "\nvexa_camera_pictures_total{camera=\"gate\"} 1\n",
        "\nvexa_camera_last_picture_timestamp_seconds{camera=\"gate\"} 1700000000\n", "\nvexa_serve_viewers 2\n"}) {
    EXPECT_NE(text.find(part), std::string::npos) << part;
  }
  EXPECT_EQ(text.find("# EOF"), std::string::npos);
}

TEST(Metrics, InOpenMetricsNameCountersWithoutTotalAndEnd) {
  Wall wall;
  wall.add("gate");
  const std::string text = wall.metrics(Wall::MetricsFormat::kOpenMetrics, {}, "1.2.3");
  EXPECT_NE(text.find("\n# TYPE vexa_camera_pictures counter\n"), std::string::npos);
  EXPECT_NE(text.find("\nvexa_camera_pictures_total{camera=\"gate\"} 0\n"), std::string::npos);
  EXPECT_EQ(text.substr(text.size() - 7), "\n# EOF\n");
}

TEST(Metrics, EscapeACamerasName) {
  Wall wall;
  wall.add("a\"b\\c\nd\x1b\xff");
  const std::string text = wall.metrics(Wall::MetricsFormat::kPrometheus, {}, "1");
  EXPECT_NE(text.find("{camera=\"a\\\"b\\\\c\\nd\xef\xbf\xbd\"}"), std::string::npos) << text;
}

TEST(Metrics, OfACameraAreAtMostForty) {
  Wall wall;
  wall.add("gate");
  const std::string text = wall.metrics(Wall::MetricsFormat::kPrometheus, {}, "1");
  std::size_t series = 0;
  for (std::size_t at = text.find("camera=\"gate\""); at != std::string::npos;
       at = text.find("camera=\"gate\"", at + 1)) {
    ++series;
  }
  EXPECT_EQ(series, 5U);
}

TEST(MetricsFormat, IsWhatTheAcceptFieldAsksFor) {
  EXPECT_EQ(metrics_format(""), Wall::MetricsFormat::kPrometheus);
  EXPECT_EQ(metrics_format("text/plain"), Wall::MetricsFormat::kPrometheus);
  EXPECT_EQ(metrics_format("application/openmetrics-text; version=1.0.0,text/plain;q=0.5"),
            Wall::MetricsFormat::kOpenMetrics);
  EXPECT_EQ(metrics_type(Wall::MetricsFormat::kPrometheus), "text/plain; version=0.0.4; charset=utf-8");
}

}  // namespace
}  // namespace vexa::host
