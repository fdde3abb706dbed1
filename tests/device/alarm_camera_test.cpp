// SPDX-License-Identifier: Apache-2.0
// Alarms, detection settings and metadata between the driver and the virtual camera.
#include <arpa/inet.h>
#include <gtest/gtest.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <unistd.h>

#include <memory>
#include <string>
#include <vector>

#include "tests/device/alarm_driver.h"
#include "tests/device/detection_records.h"
#include "tests/support/own_address.h"
#include "tests/support/process_state.h"
#include "virtual_camera/virtual_camera.h"

namespace vexa_test {
namespace {

using Kind = vexa::camera::AlarmEvent::Kind;

vexa::camera::CameraOptions watched_camera() {
  vexa::camera::CameraOptions options;
  options.address = own_loopback(0);
  options.password = "secret";
  options.rtsp_port = 0;
  options.control = true;
  options.speed = 20;  // a part without changes 20 times a second
  return options;
}

class AlarmsOfACamera : public testing::Test {
 protected:
  void start(const vexa::camera::CameraOptions& options = watched_camera()) {
    camera_ = std::make_unique<vexa::camera::VirtualCamera>(options);
    ASSERT_TRUE(camera_->start()) << camera_->error();
    driver_.use(camera_->address(), camera_->http_port(), 5000);
    SLibDFixedIoBoxInfo& box = driver_.m_FixedIoBoxInfo;
    box.inputCount = 2;
    box.videoDetection = box.tamperingDetection = box.audioDetection = true;
  }
  void happen(Kind kind, int number, int value) { ASSERT_TRUE(camera_->alarms().happen({kind, number, value})); }

  /// The states of the next status call: input 1, input 2, detection, tampering, audio.
  std::vector<int> next_states() {
    std::vector<SLibDPinInfo> pins;
    EXPECT_EQ(driver_.GetCurrentIoStatus(pins), LIBD_OK);
    std::vector<int> states;
    for (const SLibDPinInfo& pin : pins) states.push_back(pin.state);
    return states;
  }
  /// True once a status call gives these states.
  bool comes_to(const std::vector<int>& states) {
    return eventually([&] { return next_states() == states; });
  }
  /// What the control port answers.
  std::string ask_control(const std::string& path) {
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_port = htons(camera_->control_port());
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    const int connection = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    EXPECT_EQ(connect(connection, reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
    const std::string request = "GET " + path + " HTTP/1.0\r\n\r\n";
    EXPECT_EQ(send(connection, request.data(), request.size(), MSG_NOSIGNAL), static_cast<ssize_t>(request.size()));
    char answer[256] = {};
    EXPECT_GT(recv(connection, answer, sizeof answer - 1, 0), 0);
    close(connection);
    return std::string(answer).substr(9, 3);
  }

  std::unique_ptr<vexa::camera::VirtualCamera> camera_;
  AlarmDriver driver_;
};

TEST_F(AlarmsOfACamera, BeginWithTheStatesOfTheContacts) {
  start();
  happen(Kind::kContact, 2, 1);
  ASSERT_EQ(driver_.StartIoStreaming(), LIBD_OK);
  EXPECT_EQ(next_states(), (std::vector<int>{0, 1}));
  EXPECT_EQ(next_states(), (std::vector<int>{0, 1, 0, 0, 0}));
}

/// Contact 1, contact 2 and window 1, of which one after the other changes.
using AlarmWorld = std::vector<int>;

AlarmWorld world_after(int change) { return {change / 3 % 2, (change + 2) / 3 % 2, (change + 1) / 3 % 2}; }

// One virtual hour, in bursts. Somebody covers the lens anew as soon as its alarm is cleared.
TEST_F(AlarmsOfACamera, LoseNoneOf10000ChangesAndClearTamperingOnceAMinute) {
  constexpr int kChanges = 10000;
  constexpr int kBurst = 20;
  constexpr int kHour = 3600;
  constexpr int kDelay = 16;  // seconds: that the alarm is cleared and is there anew waits behind a burst each time
  vexa::camera::CameraOptions options = watched_camera();
  options.speed = 1;
  start(options);
  ASSERT_EQ(driver_.SetTamperingAlarm(true, LIBD_TAMPER_LOW), LIBD_OK);
  happen(Kind::kLens, 1, 1);
  ASSERT_EQ(driver_.StartIoStreaming(), LIBD_OK);
  ASSERT_EQ(next_states(), (std::vector<int>{0, 0}));
  std::vector<std::time_t> clears = {alarm_clock_now};
  for (int change = 1; change <= kChanges; ++change) {
    for (int ahead = change; change % kBurst == 1 && ahead < change + kBurst; ++ahead) {
      const AlarmWorld world = world_after(ahead);
      happen(Kind::kContact, 1, world[0]);
      happen(Kind::kContact, 2, world[1]);
      happen(Kind::kMotion, 1, world[2]);
    }
    alarm_clock_now = 1000 + change * kHour / kChanges;
    // Before the change only the state of the lens may come, or a part without changes.
    AlarmWorld states;
    for (int parts = 0; parts < 10 && states != world_after(change); ++parts) {
      states = next_states();
      ASSERT_EQ(states.size(), 5U);
      if (states[3] == 0) happen(Kind::kLens, 1, 1);
      states.resize(3);
      ASSERT_TRUE(states == world_after(change) || states == world_after(change - 1)) << change;
    }
    ASSERT_EQ(states, world_after(change)) << change;
    if (camera_->journal().count("TamperingStatusClear=on") == clears.size()) clears.push_back(alarm_clock_now);
  }
  EXPECT_EQ(camera_->journal().count("TamperingStatusClear=on"), clears.size() - 1);
  for (std::size_t i = 1; i < clears.size(); ++i) {
    EXPECT_GE(clears[i] - clears[i - 1], 60) << i;
    EXPECT_LE(clears[i] - clears[i - 1], 60 + kDelay) << i;
  }
  EXPECT_LE(1000 + kHour - clears.back(), 60 + kDelay);
}

TEST_F(AlarmsOfACamera, OfADetectorComeWhenItIsSwitchedOn) {
  start();
  ASSERT_EQ(driver_.StartIoStreaming(), LIBD_OK);
  ASSERT_EQ(next_states(), (std::vector<int>{0, 0}));
  happen(Kind::kLens, 1, 1);
  happen(Kind::kNoise, 1, 1);
  EXPECT_TRUE(comes_to({0, 0, 0, 0, 0}));
  ASSERT_EQ(driver_.SetTamperingAlarm(true, LIBD_TAMPER_HIGH), LIBD_OK);
  EXPECT_TRUE(comes_to({0, 0, 0, 1, 0}));
  ASSERT_EQ(driver_.SetAudioDetection(true), LIBD_OK);
  EXPECT_TRUE(comes_to({0, 0, 0, 1, 1}));
  SLibDIoBoxInfo info;
  ASSERT_EQ(driver_.GetIoBoxInfo(info), LIBD_OK);
  EXPECT_EQ(info.tamperLevel, 3);
  EXPECT_EQ(rows_of(info.pins), (std::vector<PinRow>{{1, 0, 1, 0}, {2, 0, 1, 0}, {3, 4, 1, 0}, {4, 5, 1, 0}}));
}

TEST_F(AlarmsOfACamera, OfTamperingAreClearedAfterAMinute) {
  start();
  ASSERT_EQ(driver_.SetTamperingAlarm(true, LIBD_TAMPER_LOW), LIBD_OK);
  happen(Kind::kLens, 1, 1);
  ASSERT_EQ(driver_.StartIoStreaming(), LIBD_OK);
  ASSERT_EQ(next_states(), (std::vector<int>{0, 0}));
  EXPECT_EQ(next_states(), (std::vector<int>{0, 0, 0, 1, 0}));
  alarm_clock_now = 1060;
  EXPECT_TRUE(comes_to({0, 0, 0, 0, 0}));
}

TEST_F(AlarmsOfACamera, ComeFromTheControlPort) {
  start();
  ASSERT_EQ(driver_.SetTamperingAlarm(true, LIBD_TAMPER_LOW), LIBD_OK);
  ASSERT_EQ(driver_.SetAudioDetection(true), LIBD_OK);
  ASSERT_EQ(driver_.StartIoStreaming(), LIBD_OK);
  ASSERT_EQ(next_states(), (std::vector<int>{0, 0}));
  const struct {
    const char* path;
    std::vector<int> states;
  } rows[] = {{"/contact/1/close", {1, 0, 0, 0, 0}}, {"/contact/2/close", {1, 1, 0, 0, 0}},
              {"/contact/1/open", {0, 1, 0, 0, 0}},  {"/lens/cover", {0, 1, 0, 1, 0}},
              {"/noise/on", {0, 1, 0, 1, 1}},        {"/lens/free", {0, 1, 0, 0, 1}},
              {"/noise/off", {0, 1, 0, 0, 0}},       {"/motion/4/7", {0, 1, 1, 0, 0}},
              {"/motion/4/0", {0, 1, 0, 0, 0}}};
  for (const auto& row : rows) {
    EXPECT_EQ(ask_control(row.path), "204");
    EXPECT_TRUE(comes_to(row.states)) << row.path;
  }
}

TEST_F(AlarmsOfACamera, ComeFromNoOtherPath) {
  start();
  for (const char* path :
       {"/contact", "/contact/1", "/contact/1/closed", "/contact/x/close", "/lens/1/cover", "/motion/1/x", "/noise",
        "/command/main.cgi", "/contact/1/close/again", "/walk/0", "/walk/3601", "/walk/fast", "/walk/1/2"}) {
    EXPECT_EQ(ask_control(path), "404") << path;
  }
  for (const char* path : {"/contact/0/close", "/contact/3/close", "/contact/-1/open", "/motion/0/1", "/motion/5/1"}) {
    EXPECT_EQ(ask_control(path), "400") << path;
  }
}

TEST_F(AlarmsOfACamera, FollowAnIntruderThroughTheWindows) {
  start();
  ASSERT_EQ(driver_.StartModRawData(), LIBD_OK);
  EXPECT_EQ(ask_control("/walk/40"), "204");  // two seconds at this camera's pace
  SLibDRawMDFrameInfo frame;
  for (std::int32_t SLibDRawMDFrameInfo::*window : {&SLibDRawMDFrameInfo::window1, &SLibDRawMDFrameInfo::window2,
                                                    &SLibDRawMDFrameInfo::window3, &SLibDRawMDFrameInfo::window4}) {
    EXPECT_TRUE(eventually([&] { return driver_.GetCurrentPosition(frame) == LIBD_OK && frame.*window > 0; }));
  }
  EXPECT_TRUE(eventually([&] { return driver_.GetCurrentPosition(frame) == LIBD_OK && frame.window4 == 0; }));
  EXPECT_EQ(driver_.StopModRawData(), LIBD_OK);
}

TEST_F(AlarmsOfACamera, FollowAnIntruderThroughTheAreasThatTheHostSets) {
  start();
  driver_.m_UseMotionDetection = false;
  driver_.SetVMDtype(LIBD_VMD_WINDOW);
  SLibDDetectionParam param;
  param.number = 99;
  for (SLibDDetectionWindow& window : param.windows) window.area = {{0, 0}, {0, 0}};
  param.windows[1].enabled = 1;
  param.windows[1].mode = 0;
  param.windows[1].area = {{6000, 0}, {10000, 10000}};  // the right side, above ground
  param.windows[2] = param.windows[1];
  param.windows[2].area = {{0, 0}, {10000, 1000}};  // higher than anybody walks
  ASSERT_EQ(driver_.SetDetectionParam(param), LIBD_OK);
  ASSERT_EQ(driver_.StartModRawData(), LIBD_OK);
  EXPECT_EQ(ask_control("/walk/30"), "204");
  SLibDRawMDFrameInfo frame;
  int others = 0;
  const auto second_window_is = [&](bool moving) {
    return eventually([&] {
      if (driver_.GetCurrentPosition(frame) != LIBD_OK) return false;
      others += frame.window1 + frame.window3 + frame.window4;
      return (frame.window2 > 0) == moving;
    });
  };
  EXPECT_TRUE(second_window_is(false)) << "the walk begins at the left";
  EXPECT_TRUE(second_window_is(true));
  EXPECT_TRUE(second_window_is(false));
  EXPECT_EQ(others, 0);
}

TEST_F(AlarmsOfACamera, SeeNobodyThroughACoveredLens) {
  start();
  ASSERT_EQ(driver_.StartModRawData(), LIBD_OK);
  EXPECT_EQ(ask_control("/walk/3600"), "204");
  SLibDRawMDFrameInfo frame;
  const auto moving = [&] { return driver_.GetCurrentPosition(frame) == LIBD_OK && frame.window1 > 0; };
  const auto still = [&] { return driver_.GetCurrentPosition(frame) == LIBD_OK && frame.window1 == 0; };
  EXPECT_TRUE(eventually(moving));
  EXPECT_EQ(ask_control("/lens/cover"), "204");
  EXPECT_TRUE(eventually(still));
  EXPECT_EQ(ask_control("/lens/free"), "204");
  EXPECT_TRUE(eventually(moving));
}

TEST_F(AlarmsOfACamera, OfMotionFollowTheKindOfDetection) {
  for (const char* kind : {"object", "motion", "lod"}) {
    vexa::camera::CameraOptions options = watched_camera();
    options.alarms.detection = kind;
    start(options);
    driver_.m_UseMotionDetection = options.alarms.detection == "motion";
    driver_.SetVMDtype(options.alarms.detection == "lod" ? LIBD_VMD_VMF : LIBD_VMD_WINDOW);
    happen(Kind::kMotion, 3, 9);
    ASSERT_EQ(driver_.StartIoStreaming(), LIBD_OK);
    ASSERT_EQ(next_states(), (std::vector<int>{0, 0}));
    // Motion by windows shares the first bit, and its own stays out of the part.
    const bool shared = driver_.m_UseMotionDetection;
    EXPECT_EQ(next_states(), shared ? (std::vector<int>{1, 0, 0, 0}) : (std::vector<int>{0, 0, 1, 0, 0})) << kind;
    ASSERT_EQ(driver_.StopIoStreaming(), LIBD_OK);
  }
}

TEST_F(AlarmsOfACamera, DetectionSettingsReadBackEqual) {
  start();
  driver_.m_FixedPTZControlInfo.presetCount = 16;
  SLibDDetectionParam current = marked_setting(99);
  ASSERT_EQ(driver_.SetDetectionParam(current), LIBD_OK);
  ASSERT_EQ(driver_.SetPositionMode(LIBD_POSITION_CURRENT), LIBD_OK);
  std::vector<SLibDDetectionParam> settings;
  ELibDPositionMode mode = LIBD_POSITION_PRESET;
  ASSERT_EQ(driver_.GetObjectDetectionSetting(settings, mode), LIBD_OK);
  EXPECT_EQ(mode, LIBD_POSITION_CURRENT);
  ASSERT_EQ(settings.size(), 1U);
  EXPECT_EQ(setting_rows(settings[0]), setting_rows(current));
}

TEST_F(AlarmsOfACamera, LodSettingsReadBackEqual) {
  start();
  driver_.m_LodDetection = true;
  SLibDDetectionParam param;
  param.windows[0].minObjectWidth = 2;
  param.windows[0].sensitivity = 77;
  ASSERT_EQ(driver_.SetDetectionParam(param), LIBD_OK);
  std::vector<SLibDDetectionParam> settings;
  ELibDPositionMode mode = LIBD_POSITION_PRESET;
  ASSERT_EQ(driver_.GetObjectDetectionSetting(settings, mode), LIBD_OK);
  ASSERT_EQ(settings.size(), 17U);
  EXPECT_EQ(setting_rows(settings[16]), setting_rows(param));
}

}  // namespace
}  // namespace vexa_test
