// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/fleet/fleet_file.h"

#include <gtest/gtest.h>

#include "virtual_camera/model/setting_rules.h"

namespace vexa::camera {
namespace {

const std::string kProfiles = std::string(VEXA_SOURCE_DIR) + "/models/profiles/";

std::vector<FleetCamera> cameras_of(const std::string& text, const CameraOptions& common = {}) {
  FleetResult read = parse_fleet(text, "fleet.json", common);
  if (const auto* error = std::get_if<std::string>(&read)) ADD_FAILURE() << *error;
  auto* cameras = std::get_if<std::vector<FleetCamera>>(&read);
  return cameras == nullptr ? std::vector<FleetCamera>() : std::move(*cameras);
}

std::string refusal_of(const std::string& text) {
  const FleetResult read = parse_fleet(text, "fleet.json", {});
  const auto* error = std::get_if<std::string>(&read);
  return error == nullptr ? "taken" : *error;
}

TEST(FleetFile, ACameraHasWhatTheFileStates) {
  const auto cameras = cameras_of(R"({"cameras": [{"name": "gate", "profile": ")" + kProfiles + R"(VX-2000.json",
    "address": "127.9.8.7", "httpPort": 8080, "rtspPort": 5540, "user": "u", "password": "p", "maxViewers": 1,
    "cardMegabytes": 2, "packetFaults": {"loss": 0.25, "burst-length": 3}, "network": "unplugged",
    "requestFaults": [{"fault": "slow-answer", "match": "PLAY#2", "value": 70}],
    "settings": {"camera": {"ImageCodec1": "jpeg"}}}]})");
  ASSERT_EQ(cameras.size(), 1U);
  const FleetCamera& camera = cameras[0];
  EXPECT_EQ(camera.name, "gate");
  ASSERT_TRUE(camera.options.profile);
  EXPECT_EQ(camera.options.profile->profile().model, "VX-2000");
  EXPECT_EQ(camera.options.address, "127.9.8.7");
  EXPECT_EQ(camera.options.http_port, 8080);
  EXPECT_EQ(camera.options.rtsp_port, 5540);
  EXPECT_EQ(camera.options.user, "u");
  EXPECT_EQ(camera.options.password, "p");
  EXPECT_EQ(camera.options.max_viewers, 1U);
  EXPECT_EQ(camera.options.card_bytes, 2U << 20U);
  EXPECT_EQ(camera.options.packet_faults.loss, 0.25);
  EXPECT_EQ(camera.options.packet_faults.burst_length, 3U);
  EXPECT_FALSE(camera.plugged);
  ASSERT_EQ(camera.options.request_faults.size(), 1U);
  EXPECT_EQ(camera.options.request_faults[0].occurrence, 2U);
  ASSERT_EQ(camera.settings.size(), 1U);
  EXPECT_EQ(camera.settings[0].second.second, "jpeg");
}

TEST(FleetFile, WhatACameraDoesNotStateIsCommonToAll) {
  CameraOptions common;
  common.user = "all";
  common.address = "127.1.0.1";
  common.seed = 40;
  const auto cameras = cameras_of(R"({"cameras": [{}, {"address": "127.2.0.255"}, {}]})", common);
  ASSERT_EQ(cameras.size(), 3U);
  EXPECT_EQ(cameras[0].options.address, "127.1.0.1");
  EXPECT_EQ(cameras[1].options.address, "127.2.0.255");
  EXPECT_EQ(cameras[2].options.address, "127.2.1.0");
  for (std::size_t i = 0; i < 3; ++i) {
    EXPECT_EQ(cameras[i].options.user, "all");
    EXPECT_EQ(cameras[i].options.seed, 40 + i);
    EXPECT_EQ(cameras[i].name, "camera-" + std::to_string(i + 1));
  }
}

TEST(FleetFile, CamerasOfOneEntryAreNumbered) {
  const auto cameras = cameras_of(R"({"cameras": [{"name": "Yard", "count": 3}, {"name": "roof"}]})");
  ASSERT_EQ(cameras.size(), 4U);
  EXPECT_EQ(cameras[0].name, "Yard-1");
  EXPECT_EQ(cameras[2].name, "Yard-3");
  EXPECT_EQ(cameras[3].name, "roof");
  EXPECT_EQ(cameras[2].options.address, "127.0.0.4");
}

TEST(FleetFile, WhatIsWrongIsReportedWithItsLineAndKey) {
  const std::string range = "must be a whole number from ";
  const struct {
    std::string text;
    std::string refusal;
  } cases[] = {
      {"", "fleet.json:1: not JSON: something is missing, too many or misspelt here"},
      {"[]", "fleet.json:1: cameras: must be a list of cameras"},
      {R"({"cameras": []})", "fleet.json:1: cameras: must be a list of cameras"},
      {"{\"cameras\": [{}],\n\"more\": 1}", "fleet.json:2: more: is no key of a fleet"},
      {"{\"cameras\": [{\n\"colour\": 1}]}", "fleet.json:2: colour: is no key of a camera"},
      {"{\"cameras\": [{\n\n\"name\": \"a b\"}]}",
       "fleet.json:3: name: must have 1 to 64 of a-z, A-Z, 0-9, \"-\" and \"_\""},
      {R"({"cameras": [{"name": "all"}]})", "fleet.json:1: name: must have 1 to 64 of a-z, A-Z, 0-9, \"-\" and \"_\""},
      {"{\"cameras\": [{\"name\": \"a\"},\n{\"name\": \"A\"}]}",
       "fleet.json:2: name: A is too long, or another camera's"},
      {"{\"cameras\": [{\n\"address\": \"192.0.2.1\"}]}", "fleet.json:2: address: must be an address of 127.0.0.0/8"},
      {R"({"cameras": [{"address": "127.0.0.x"}]})", "fleet.json:1: address: must be an address of 127.0.0.0/8"},
      {R"({"cameras": [{"address": "127.255.255.255", "count": 2}]})", "fleet.json:1: address: leaves 127.0.0.0/8"},
      {R"({"cameras": [{"count": 1001}]})", "fleet.json:1: count: " + range + "1 to 1000"},
      {R"({"cameras": [{"count": 1000}, {}]})", "fleet.json:1: count: a fleet has at most 1000 cameras"},
      {R"({"cameras": [{"httpPort": 65536}]})", "fleet.json:1: httpPort: " + range + "0 to 65535"},
      {R"({"cameras": [{"maxViewers": 0}]})", "fleet.json:1: maxViewers: " + range + "1 to 256"},
      {R"({"cameras": [{"password": 5}]})", "fleet.json:1: password: must be a text"},
      {R"({"cameras": [{"network": "gone"}]})", "fleet.json:1: network: must be \"plugged\" or \"unplugged\""},
      {"{\"cameras\": [{\"packetFaults\": {\n\"loss\": 2}}]}",
       "fleet.json:2: packetFaults.loss: is no fault of packets, or has a value out of its range"},
      {R"({"cameras": [{"requestFaults": [{"fault": "nonsense"}]}]})",
       "fleet.json:1: requestFaults: must hold objects of \"fault\", \"match\" and \"value\""},
      {R"({"cameras": [{"settings": {"camera": {"ImageCodec1": 5}}}]})",
       "fleet.json:1: settings.camera.ImageCodec1: must be a text"},
  };
  for (const auto& c : cases) EXPECT_EQ(refusal_of(c.text), c.refusal) << c.text;
}

TEST(FleetFile, AProfileThatIsNotThereIsReportedWithItsLine) {
  const std::string refusal = refusal_of("{\"cameras\": [{\n\"profile\": \"/nowhere/x.json\"}]}");
  EXPECT_EQ(refusal.substr(0, 23), "fleet.json:2: profile: ") << refusal;
}

TEST(FleetFile, AFileThatCannotBeReadIsReported) {
  const FleetResult read = load_fleet("/nowhere/fleet.json", {});
  ASSERT_NE(std::get_if<std::string>(&read), nullptr);
  EXPECT_EQ(std::get<std::string>(read), "cannot read /nowhere/fleet.json");
}

TEST(FleetOfANumber, TakesTheProfileThatIsCommonAndConsecutiveAddresses) {
  CameraOptions common;
  common.profile_path = kProfiles + "LMX-P200.json";
  const FleetResult made = make_fleet(2, common);
  const auto* cameras = std::get_if<std::vector<FleetCamera>>(&made);
  ASSERT_NE(cameras, nullptr) << std::get<std::string>(made);
  ASSERT_EQ(cameras->size(), 2U);
  EXPECT_EQ((*cameras)[0].name, "lmx-p200-1");
  EXPECT_EQ((*cameras)[1].name, "lmx-p200-2");
  EXPECT_EQ((*cameras)[1].options.address, "127.0.0.3");
  EXPECT_EQ((*cameras)[0].options.profile, (*cameras)[1].options.profile);
}

TEST(FleetOfANumber, AnAddressElsewhereIsRefused) {
  CameraOptions common;
  common.profile_path = kProfiles + "LMX-P200.json";
  common.address = "192.0.2.1";
  EXPECT_EQ(std::get<std::string>(make_fleet(1, common)), "a fleet's addresses are those of 127.0.0.0/8");
}

}  // namespace
}  // namespace vexa::camera
