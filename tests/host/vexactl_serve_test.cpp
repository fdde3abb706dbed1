// SPDX-License-Identifier: Apache-2.0
// vexactl serve, in front of virtual cameras.
#include <arpa/inet.h>
#include <sys/socket.h>

#include <nlohmann/json.hpp>

#include "tests/host/camera_fixture.h"
#include "tests/support/process_state.h"

namespace vexa_test {
namespace {

class ServeCommand : public WithCamera {
 protected:
  // Serves what is written into cameras.json; returns the line that it prints.
  std::string serve(const std::string& cameras, std::vector<std::string> more = {}) {
    folder().make_file("cameras.json", cameras);
    folder().make_file("camera.cred", std::string(kUser) + ":" + kPassword + "\n");
    std::vector<std::string> arguments = {"serve",  "--cameras", "cameras.json", "--address",    own_loopback(4),
                                          "--port", "0",         "--host",       own_loopback(4)};
    arguments.insert(arguments.end(), more.begin(), more.end());
    run_ = std::make_unique<ReadRun>(folder(), vexactl(arguments), std::vector<std::string>{}, ReadRun::Reader::kPipe);
    std::string line = run_->read_lines(1);
    const std::size_t colon = line.rfind(':');
    port_ = colon == std::string::npos ? 0 : std::atoi(line.c_str() + colon + 1);
    const std::size_t mark = line.find("#token=");
    token_ = mark == std::string::npos ? "" : line.substr(mark + 7, line.size() - mark - 8);
    return line;
  }
  // Up to `most` bytes of the answer.
  std::string get(const std::string& path, std::size_t most = std::string::npos) {
    const int connection = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_in place{};
    place.sin_family = AF_INET;
    place.sin_port = htons(static_cast<std::uint16_t>(port_));
    inet_pton(AF_INET, own_loopback(4).c_str(), &place.sin_addr);
    std::string answer;
    if (connect(connection, reinterpret_cast<const sockaddr*>(&place), sizeof place) == 0) {
      const std::string request =
          "GET " + path + " HTTP/1.0\r\nHost: " + own_loopback(4) + "\r\nAuthorization: Bearer " + token_ + "\r\n\r\n";
      EXPECT_EQ(send(connection, request.data(), request.size(), MSG_NOSIGNAL), static_cast<ssize_t>(request.size()));
      char piece[65536];
      for (ssize_t got = 0; answer.size() < most && (got = recv(connection, piece, sizeof piece, 0)) > 0;) {
        answer.append(piece, static_cast<std::size_t>(got));
      }
    }
    close(connection);
    return answer;
  }
  nlohmann::json camera_state() {
    const std::string answer = get("/api/cameras/gate");
    const std::size_t end = answer.find("\r\n\r\n");
    return end == std::string::npos ? nlohmann::json::object()
                                    : nlohmann::json::parse(answer.substr(end), nullptr, false);
  }
  std::string one_camera(int stream) const {
    return R"({"cameras": [{"name": "gate", "address": ")" + place() +
           R"(", "credentials": "camera.cred", "tileStream": )" + std::to_string(stream) + "}]}";
  }
  int end_by(int signal) {
    run_->program().signal(signal);
    return run_->program().wait().exit_code;
  }
  void start_model() {
    vexa::camera::CameraOptions options;
    options.profile_path = VEXA_SOURCE_DIR "/models/profiles/VX-2000.json";
    start_as_set(options);
  }

  std::unique_ptr<ReadRun> run_;
  int port_ = 0;
  std::string token_;
};

TEST_F(ServeCommand, ServesPicturesOfACameraAndEndsOnASignal) {
  start_model();
  const std::string line = serve(one_camera(2));
  ASSERT_EQ(line.substr(0, 8 + own_loopback(4).size()), "http://" + own_loopback(4) + ":") << line;
  ASSERT_EQ(token_.size(), 32U);
  ASSERT_TRUE(
      eventually([this] { return get("/cameras/gate/picture.jpg").find("\r\n\r\n\xff\xd8") != std::string::npos; }));
  const auto state = camera_state();
  EXPECT_EQ(state["state"], "live");
  EXPECT_EQ(state["hasPicture"], true);
  EXPECT_NE(get("/metrics").find("vexa_camera_live{camera=\"gate\"} 1\n"), std::string::npos);
  EXPECT_EQ(end_by(SIGTERM), 0);
}

TEST_F(ServeCommand, ACameraThatIsUnpluggedComesBackByItself) {
  start_model();
  // A camera is given up after some of its time-outs.
  serve(one_camera(2), {"--timeout", "1000"});
  ASSERT_TRUE(eventually([this] { return camera_state()["state"] == "live"; }));
  camera().unplug();
  ASSERT_TRUE(eventually([this] { return camera_state()["state"] != "live"; }));
  camera().plug();
  ASSERT_TRUE(eventually([this] { return camera_state()["state"] == "live"; }));
  EXPECT_GE(camera_state()["interruptions"], 1);
  EXPECT_EQ(end_by(SIGINT), 0);
}

TEST_F(ServeCommand, NothingThatItServesHoldsCredentialsOrTheCamerasAddress) {
  start_model();
  serve(one_camera(2));
  ASSERT_TRUE(eventually([this] { return camera_state()["state"] == "live"; }));
  for (const char* path : {"/", "/wall.js", "/api/cameras", "/metrics", "/openapi.json", "/healthz", "/readyz"}) {
    const std::string answer = get(path);
    EXPECT_EQ(answer.substr(9, 3), "200") << path;
    for (const std::string& secret : {std::string(kUser), std::string(kPassword), std::string(kBasicToken), place()}) {
      EXPECT_EQ(answer.find(secret), std::string::npos) << path << " " << secret;
    }
  }
  EXPECT_EQ(end_by(SIGTERM), 0);
}

TEST_F(ServeCommand, TakesTheTokenOfAFile) {
  folder().make_file("token", "my-token-of-16-or-more\n");
  folder().make_file("short", "short\n");
  start_model();
  serve(one_camera(2), {"--token-file", "token"});
  EXPECT_EQ(token_, "my-token-of-16-or-more");
  EXPECT_EQ(end_by(SIGTERM), 0);
  EXPECT_EQ(run({"serve", "--cameras", "cameras.json", "--token-file", "short"}).exit_code, 1);
}

TEST_F(ServeCommand, ServesTheFirstStreamAsMp4WhileSomebodyViewsIt) {
  start_model();
  serve(one_camera(2));
  const std::string answer = get("/cameras/gate/video.mp4", 20000);
  const std::size_t body = answer.find("\r\n\r\n");
  ASSERT_NE(body, std::string::npos);
  EXPECT_NE(answer.find("Content-Type: video/mp4\r\n"), std::string::npos);
  EXPECT_EQ(answer.substr(body + 8, 4), "ftyp");
  EXPECT_NE(answer.find("avcC", body), std::string::npos);
  EXPECT_NE(answer.find("mdat", body), std::string::npos);
  EXPECT_TRUE(eventually([this] { return camera().sessions() <= 1; }));
  EXPECT_EQ(end_by(SIGTERM), 0);
}

TEST_F(ServeCommand, AWrongFileOfCamerasEndsWithOneAndNamesItsLine) {
  folder().make_file("cameras.json", "{\"cameras\": [\n{\"name\": \"gate\", \"colour\": 1}]}");
  const ProgramResult result = run({"serve", "--cameras", "cameras.json"});
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_NE(result.err.find("cameras.json, line 2"), std::string::npos) << result.err;
}

}  // namespace
}  // namespace vexa_test
