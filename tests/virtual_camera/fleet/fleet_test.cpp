// SPDX-License-Identifier: Apache-2.0
// A fleet at work: its cameras, its control port, and the file of cameras that it writes.
#include "virtual_camera/fleet/fleet.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <nlohmann/json.hpp>

#include "tests/support/process_state.h"
#include "tests/support/temporary_folder.h"
#include "tests/virtual_camera/camera_client.h"
#include "virtual_camera/codec/rtp_packetiser.h"

namespace vexa::camera {
namespace {

using nlohmann::json;

class FleetAtWork : public testing::Test {
 protected:
  void start(const std::string& cameras) {
    CameraOptions common = test_options();
    static const auto kClip = PacketisedClip::load(std::string(VEXA_CLIPS) + "/small.h264", 1400, {});
    common.clip = kClip;
    FleetResult read = parse_fleet("{\"cameras\": " + cameras + "}", "fleet.json", common);
    ASSERT_EQ(std::get_if<std::string>(&read), nullptr) << std::get<std::string>(read);
    fleet_ = std::make_unique<Fleet>(std::get<std::vector<FleetCamera>>(std::move(read)));
    ASSERT_TRUE(fleet_->start(0)) << fleet_->error();
  }
  std::string control(const std::string& path, const std::string& fields = "") {
    Client client("127.0.0.1", fleet_->control_port());
    client.send("GET " + path + " HTTP/1.0\r\n" + fields + "\r\n");
    return client.read_to_end();
  }
  std::string status_of(const std::string& path) { return control(path).substr(9, 3); }
  json camera_state(std::size_t index) {
    const std::string answer = control("/cameras");
    return json::parse(answer.substr(answer.find("\r\n\r\n")))["cameras"][index];
  }
  std::string inquire(std::size_t index, const std::string& section) {
    Client client(fleet_->camera(index).address(), fleet_->camera(index).http_port());
    client.send(http_get("/command/inquiry.cgi?inq=" + section));
    return client.read_to_end();
  }

  std::unique_ptr<Fleet> fleet_;
};

TEST_F(FleetAtWork, EachCameraHasAnAddressASerialNumberAndAMacOfItsOwn) {
  start(R"([{"name": "a", "count": 2}])");
  EXPECT_NE(fleet_->camera(0).address(), fleet_->camera(1).address());
  EXPECT_NE(inquire(0, "system").find("Serial=100001"), std::string::npos);
  EXPECT_NE(inquire(1, "system").find("Serial=100002"), std::string::npos);
  EXPECT_NE(inquire(1, "network").find("MacAddress=02:00:00:00:00:02"), std::string::npos);
}

TEST_F(FleetAtWork, TheControlPortListsWhatCanBeAsked) {
  start(R"([{"name": "a"}])");
  const std::string text = control("/");
  EXPECT_NE(text.find("Content-Type: text/plain"), std::string::npos);
  for (const char* path : {"/cameras", "/camera/NAME/", "/walk", "/reboot", "/faults/packets", "/network/unplug"}) {
    EXPECT_NE(text.find(path), std::string::npos) << path;
  }
}

TEST_F(FleetAtWork, ABrowserGetsThePageAndItsFiles) {
  start(R"([{"name": "a"}])");
  EXPECT_NE(control("/", "Accept: text/html\r\n").find("<script src=\"control.js\" defer>"), std::string::npos);
  EXPECT_NE(control("/control.js").find("Content-Type: text/javascript"), std::string::npos);
  EXPECT_NE(control("/control.css").find("Content-Type: text/css"), std::string::npos);
}

TEST_F(FleetAtWork, WhatIsAskedHappensAtTheCameraThatIsNamed) {
  start(R"([{"name": "a"}, {"name": "b"}])");
  EXPECT_EQ(status_of("/camera/b/network/unplug"), "204");
  EXPECT_TRUE(fleet_->camera(0).plugged());
  EXPECT_FALSE(fleet_->camera(1).plugged());
  EXPECT_EQ(camera_state(1)["network"], "unplugged");
  EXPECT_EQ(status_of("/camera/all/network/unplug"), "204");
  EXPECT_FALSE(fleet_->camera(0).plugged());
  EXPECT_EQ(status_of("/camera/all/network/plug"), "204");
  EXPECT_TRUE(fleet_->camera(1).plugged());
}

TEST_F(FleetAtWork, WhatCannotBeAskedIsRefused) {
  start(R"([{"name": "a"}])");
  EXPECT_EQ(status_of("/camera/nobody/lens/cover"), "404");
  EXPECT_EQ(status_of("/camera/a/lens/shatter"), "404");
  EXPECT_EQ(status_of("/camera/a"), "404");
  EXPECT_EQ(status_of("/etc/passwd"), "404");
  EXPECT_EQ(status_of("/camera/a/faults/packets?loss=2"), "400");
  EXPECT_EQ(status_of("/camera/a/faults/request/status?match=PLAY"), "400");
  EXPECT_EQ(status_of("/camera/a/contact/99/close"), "400");
  EXPECT_EQ(control("/cameras", "Host: evil.example\r\n").substr(9, 3), "421");
  EXPECT_EQ(control("/camera/a/reboot", "Sec-Fetch-Site: cross-site\r\n").substr(9, 3), "403");
}

TEST_F(FleetAtWork, ARebootedCameraIsBack) {
  start(R"([{"name": "a"}])");
  EXPECT_EQ(status_of("/camera/a/reboot/1"), "204");
  EXPECT_TRUE(vexa_test::eventually([this] { return inquire(0, "system").substr(0, 15) == "HTTP/1.0 200 OK"; }));
}

TEST_F(FleetAtWork, RequestFaultsComeAndGoWhileItRuns) {
  start(R"([{"name": "a"}])");
  EXPECT_EQ(status_of("/camera/a/faults/request/status?match=inq%3Dsystem&value=503%20Busy"), "204");
  EXPECT_EQ(camera_state(0)["requestFaults"], 1);
  EXPECT_EQ(inquire(0, "system").substr(0, 17), "HTTP/1.0 503 Busy");
  EXPECT_EQ(inquire(0, "network").substr(0, 15), "HTTP/1.0 200 OK");
  EXPECT_EQ(status_of("/camera/a/faults/clear"), "204");
  EXPECT_EQ(inquire(0, "system").substr(0, 15), "HTTP/1.0 200 OK");
}

// A host's side of one stream of a camera.
struct Watcher {
  explicit Watcher(VirtualCamera& camera) : rtsp(camera.address(), camera.rtsp_port()) {
    answer = rtsp.ask(kAsk.setup(1, udp.port()));
    const std::size_t at = answer.find("Session: ");
    if (at == std::string::npos) return;
    rtsp.ask(kAsk.play(2, static_cast<std::uint32_t>(std::stoul(answer.substr(at + 9)))));
  }
  UdpReceiver udp;
  Client rtsp;
  std::string answer;
};

TEST_F(FleetAtWork, PacketFaultsReachAStreamThatPlays) {
  start(R"([{"name": "a"}])");
  Watcher watcher(fleet_->camera(0));
  ASSERT_FALSE(watcher.udp.receive().empty());
  SentLog& sent = fleet_->camera(0).sent();
  EXPECT_EQ(status_of("/camera/a/faults/packets?loss=1"), "204");
  EXPECT_EQ(camera_state(0)["packetFaults"], json::parse(R"({"loss": 1.0})"));
  EXPECT_TRUE(vexa_test::eventually([&] {
    const auto packets = sent.snapshot();
    return !packets.empty() && packets.back().lost;
  }));
  EXPECT_EQ(status_of("/camera/a/faults/clear"), "204");
  EXPECT_EQ(camera_state(0)["packetFaults"], json::object());
  EXPECT_TRUE(vexa_test::eventually([&] { return !sent.snapshot().back().lost; }));
}

TEST_F(FleetAtWork, ACameraServesNoMoreViewersThanItCan) {
  start(R"([{"name": "a", "maxViewers": 1}])");
  Watcher first(fleet_->camera(0));
  ASSERT_EQ(first.answer.substr(0, 15), "RTSP/1.0 200 OK");
  EXPECT_EQ(camera_state(0)["viewers"], 1);
  Watcher second(fleet_->camera(0));
  EXPECT_EQ(second.answer.substr(0, 12), "RTSP/1.0 453");
  Client pictures(fleet_->camera(0).address(), fleet_->camera(0).http_port());
  pictures.send(http_get("/image1"));
  EXPECT_EQ(pictures.read_to_end().substr(0, 12), "HTTP/1.0 503");
}

TEST_F(FleetAtWork, PictureStreamsOverHttpCountAsViewers) {
  start(R"([{"name": "a", "maxViewers": 1, "profile": ")" + std::string(VEXA_SOURCE_DIR) +
        R"(/models/profiles/VX-2000.json"}])");
  {
    Client pictures(fleet_->camera(0).address(), fleet_->camera(0).http_port());
    pictures.send(http_get("/image1"));
    ASSERT_EQ(pictures.read_once().substr(0, 12), "HTTP/1.0 200");
    EXPECT_EQ(Watcher(fleet_->camera(0)).answer.substr(0, 12), "RTSP/1.0 453");
  }
  EXPECT_TRUE(
      vexa_test::eventually([this] { return Watcher(fleet_->camera(0)).answer.substr(0, 15) == "RTSP/1.0 200 OK"; }));
}

TEST_F(FleetAtWork, ACameraMayBeAbsentAtTheStart) {
  start(R"([{"name": "a", "network": "unplugged"}])");
  EXPECT_FALSE(Client(fleet_->camera(0).address(), fleet_->camera(0).http_port()).connected());
  EXPECT_EQ(status_of("/camera/a/network/plug"), "204");
  EXPECT_EQ(inquire(0, "system").substr(0, 15), "HTTP/1.0 200 OK");
}

TEST_F(FleetAtWork, TheFileOfCamerasNamesAddressesAndFilesOfCredentials) {
  start(R"([{"name": "a"}, {"name": "b", "user": "u", "password": "p:q"}, {"name": "c"},
            {"name": "open", "user": "", "password": ""}])");
  const vexa_test::TemporaryFolder folder;
  const std::string path = folder / "cameras.json";
  ASSERT_EQ(fleet_->write_cameras_file(path), "");
  const std::string text = vexa_test::contents_of(path);
  EXPECT_EQ(text.find("p:q"), std::string::npos);
  const json cameras = json::parse(text)["cameras"];
  ASSERT_EQ(cameras.size(), 4U);
  EXPECT_EQ(cameras[1]["name"], "b");
  EXPECT_EQ(cameras[1]["address"], fleet_->camera(1).address() + ":" + std::to_string(fleet_->camera(1).http_port()));
  EXPECT_EQ(cameras[0]["credentials"], cameras[2]["credentials"]);
  EXPECT_FALSE(cameras[3].contains("credentials"));
  const std::string credentials = folder / cameras[1]["credentials"].get<std::string>();
  EXPECT_EQ(vexa_test::contents_of(credentials), "u:p:q\n");
  struct stat state {};
  ASSERT_EQ(::stat(credentials.c_str(), &state), 0);
  EXPECT_EQ(state.st_mode & 0777U, 0600U);
}

TEST_F(FleetAtWork, AFileOfCamerasThatCannotBeWrittenIsReported) {
  start(R"([{"name": "a"}])");
  EXPECT_EQ(fleet_->write_cameras_file("/nowhere/cameras.json"),
            "cannot write /nowhere/cameras.json.1.cred: No such file or directory");
}

TEST(FleetStart, TheFileOfCamerasNamesTheStreamThatIsJpeg) {
  CameraOptions common = test_options();
  common.profile_path = std::string(VEXA_SOURCE_DIR) + "/models/profiles/VX-2000.json";
  Fleet fleet(std::get<std::vector<FleetCamera>>(make_fleet(1, common)));
  ASSERT_TRUE(fleet.start()) << fleet.error();
  const vexa_test::TemporaryFolder folder;
  ASSERT_EQ(fleet.write_cameras_file(folder / "cameras.json"), "");
  EXPECT_EQ(json::parse(vexa_test::contents_of(folder / "cameras.json"))["cameras"][0]["tileStream"], 2);
}

TEST(FleetStart, TwoCamerasOfOneAddressAndPortStartNone) {
  CameraOptions common = test_options();
  const std::string twice = R"({"address": ")" + own_loopback(2) + R"(", "httpPort": 34567})";
  auto read = parse_fleet("{\"cameras\": [" + twice + "," + twice + "]}", "fleet.json", common);
  Fleet fleet(std::get<std::vector<FleetCamera>>(std::move(read)));
  EXPECT_FALSE(fleet.start());
  EXPECT_NE(fleet.error().find(":34567: Address already in use"), std::string::npos) << fleet.error();
  EXPECT_FALSE(Client(own_loopback(2), 34567).connected());
}

}  // namespace
}  // namespace vexa::camera
