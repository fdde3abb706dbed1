// SPDX-License-Identifier: Apache-2.0
// The camera's HTTP side over real connections.
#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "tests/virtual_camera/camera_client.h"
#include "virtual_camera/virtual_camera.h"

namespace vexa::camera {
namespace {

using std::chrono::milliseconds;

class HttpCamera : public testing::Test {
 protected:
  void SetUp() override { ASSERT_TRUE(camera_.start()) << camera_.error(); }

  std::string get(const std::string& request) {
    Client client(camera_.address(), camera_.http_port());
    client.send(request);
    return client.read_to_end();
  }

  VirtualCamera camera_{test_options()};
};

TEST_F(HttpCamera, AnswersAnInquiryAndClosesTheConnection) {
  camera_.settings().set_answer("own", "A=1&B=2");
  Client client(camera_.address(), camera_.http_port());
  client.send(http_get("/command/inquiry.cgi?inq=own"));
  EXPECT_EQ(client.read_to_end(), "HTTP/1.0 200 OK\r\nContent-Type: text/plain\r\nContent-Length: 7\r\n\r\nA=1&B=2");
  EXPECT_EQ(client.ended(), Ended::kClosed);
}

TEST_F(HttpCamera, ACommandChangesTheSettings) {
  EXPECT_EQ(get(http_get("/command/camera.cgi?DayNightMode=manual&DayNight=on")), "HTTP/1.0 204 No Content\r\n\r\n");
  EXPECT_EQ(camera_.settings().get("camera", "DayNightMode"), "manual");
  EXPECT_EQ(camera_.settings().get("camera", "DayNight"), "on");
}

TEST_F(HttpCamera, WrongCredentialsAreRefusedAndChangeNothing) {
  const std::string refused =
      "HTTP/1.0 401 Unauthorized\r\nWWW-Authenticate: Basic realm=\"camera\"\r\nContent-Type: text/plain\r\n"
      "Content-Length: 0\r\n\r\n";
  EXPECT_EQ(get("GET /command/camera.cgi?DayNight=x HTTP/1.0\r\n\r\n"), refused);
  EXPECT_EQ(get("GET /command/camera.cgi?DayNight=x HTTP/1.0\r\nAuthorization: Basic eDp4\r\n\r\n"), refused);
  EXPECT_EQ(camera_.settings().get("camera", "DayNight"), "off");
}

TEST(LockingCamera, IsOpenAgainWhenItsClockHasGoneOnByThirtyMinutes) {
  CameraOptions options = test_options();
  options.lock_after = 3;
  VirtualCamera camera(options);
  ASSERT_TRUE(camera.start()) << camera.error();
  const auto ask = [&](const std::string& request) {
    Client client(camera.address(), camera.http_port());
    client.send(request);
    return client.read_to_end().substr(0, 12);
  };
  const std::string right = http_get("/command/inquiry.cgi?inq=system");
  camera.set_clock(std::chrono::system_clock::time_point(std::chrono::hours(24)));
  for (int i = 0; i < 3; ++i) EXPECT_EQ(ask("GET /command/inquiry.cgi?inq=system HTTP/1.0\r\n\r\n"), "HTTP/1.0 401");
  EXPECT_TRUE(camera.locked());
  EXPECT_EQ(ask(right), "HTTP/1.0 401");
  camera.set_clock(std::chrono::system_clock::time_point(std::chrono::hours(25)));
  EXPECT_FALSE(camera.locked());
  EXPECT_EQ(ask(right), "HTTP/1.0 200");
}

TEST_F(HttpCamera, TheJournalHoldsEveryRequestByteForByte) {
  const std::string good = http_get("/command/inquiry.cgi?inq=system");
  const std::string bad = "nonsense\r\n\r\n";
  get(good);
  get(bad);
  const std::vector<Request> requests = camera_.journal().snapshot();
  ASSERT_EQ(requests.size(), 2U);
  EXPECT_EQ(requests[0].bytes, good);
  EXPECT_EQ(requests[0].status, 200);
  EXPECT_EQ(requests[0].kind, RequestKind::kHttp);
  EXPECT_EQ(requests[0].peer.substr(0, 10), "127.0.0.1:");
  EXPECT_EQ(requests[1].bytes, bad);
  EXPECT_EQ(requests[1].status, 400);
}

TEST_F(HttpCamera, ARequestMayComeByteByByte) {
  Client client(camera_.address(), camera_.http_port());
  for (const char c : http_get("/command/inquiry.cgi?inq=system")) client.send({c});
  EXPECT_EQ(client.read_to_end().substr(0, 15), "HTTP/1.0 200 OK");
}

TEST_F(HttpCamera, ARequestBrokenOffIsJournaledAsFarAsItCame) {
  { Client(camera_.address(), camera_.http_port()).send("GET /comm"); }
  ASSERT_TRUE(camera_.journal().wait_for_count("GET /comm", 1, milliseconds(kPatience)));
  EXPECT_EQ(camera_.journal().snapshot()[0].bytes, "GET /comm");
  EXPECT_EQ(camera_.journal().snapshot()[0].status, 0);
}

TEST_F(HttpCamera, AnEndlessRequestIsRefused) {
  Client client(camera_.address(), camera_.http_port());
  client.send(std::string(20000, 'A'));
  EXPECT_EQ(client.read_to_end().substr(0, 24), "HTTP/1.0 400 Bad Request");
}

TEST_F(HttpCamera, ManyClientsAtOnceAreServed) {
  std::vector<std::unique_ptr<Client>> clients;
  for (int i = 0; i < 50; ++i) {
    clients.push_back(std::make_unique<Client>(camera_.address(), camera_.http_port()));
    clients.back()->send("GET /command/inqu");
  }
  for (const auto& client : clients)
    client->send("iry.cgi?inq=system HTTP/1.0\r\n" + std::string(kBasicAdmin) + "\r\n");
  for (const auto& client : clients) EXPECT_EQ(client->read_to_end().substr(0, 15), "HTTP/1.0 200 OK");
}

TEST_F(HttpCamera, StopsRefusingAndStartsAgainOnTheSamePort) {
  const std::uint16_t port = camera_.http_port();
  camera_.stop();
  EXPECT_FALSE(Client(camera_.address(), port).connected());
  ASSERT_TRUE(camera_.start()) << camera_.error();
  EXPECT_EQ(camera_.http_port(), port);
  EXPECT_EQ(get(http_get("/command/inquiry.cgi?inq=system")).substr(0, 15), "HTTP/1.0 200 OK");
}

TEST(HttpCameraLimits, ARequestThatDawdlesIsCutOffAndJournaled) {
  CameraOptions options = test_options();
  options.request_time_limit = milliseconds(50);
  StartedCamera camera(options);
  Client client(camera.address(), camera.http_port());
  client.send("GET /slow");
  EXPECT_EQ(client.read_to_end(), "");
  EXPECT_EQ(client.ended(), Ended::kClosed);
  EXPECT_EQ(camera.journal().count("GET /slow"), 1U);
}

TEST(HttpCameraLimits, ATrickleOfBytesDoesNotStretchTheLimit) {
  CameraOptions options = test_options();
  options.request_time_limit = milliseconds(100);
  StartedCamera camera(options);
  Client client(camera.address(), camera.http_port());
  int sent = 0;
  for (; sent < 1000 && client.ended() == Ended::kNot; ++sent) {
    client.send("A");
    client.read_once(20);
  }
  EXPECT_LT(sent, 1000);
}

TEST(HttpCameraLimits, APortInUseIsReportedWithItsAddress) {
  VirtualCamera first(test_options());
  ASSERT_TRUE(first.start()) << first.error();
  CameraOptions options = test_options();
  options.http_port = first.http_port();
  VirtualCamera second(options);
  EXPECT_FALSE(second.start());
  EXPECT_EQ(second.error(),
            fmt::format("cannot listen on {}:{}: Address already in use", options.address, options.http_port));
}

TEST(HttpCameraLimits, SettingsThatMakeNoSenseAreRefusedAtTheStart) {
  const struct {
    void (*change)(CameraOptions&);
    const char* error;
  } cases[] = {
      {[](CameraOptions& o) { o.speed = 0; }, "frames per second, speed, PTZ speed and clock rate must be above 0"},
      {[](CameraOptions& o) { o.frames_per_second = -1; },
       "frames per second, speed, PTZ speed and clock rate must be above 0"},
      {[](CameraOptions& o) { o.clock_rate = 0; },
       "frames per second, speed, PTZ speed and clock rate must be above 0"},
      {[](CameraOptions& o) { o.max_payload = 2; }, "too small a packet or burst"},
      {[](CameraOptions& o) { o.burst_packets = 0; }, "too small a packet or burst"},
      {[](CameraOptions& o) { o.clip_path = "/nowhere/clip"; }, "no pictures in /nowhere/clip"},
  };
  for (const auto& c : cases) {
    CameraOptions options = test_options();
    c.change(options);
    VirtualCamera camera(options);
    EXPECT_FALSE(camera.start());
    EXPECT_EQ(camera.error(), c.error);
  }
}

}  // namespace
}  // namespace vexa::camera
