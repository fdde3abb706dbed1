// SPDX-License-Identifier: Apache-2.0
// The closed loop: a driver made for a model moves a camera of that model, and reads where it looks out of its
// pictures.
#include <gtest/gtest.h>
#include <poll.h>

#include <array>
#include <chrono>
#include <cmath>
#include <string>
#include <vector>

#include "tests/models/profile_text.h"
#include "tests/support/model_camera.h"

namespace vexa_test {
namespace {

using vexa::camera::CameraPose;
using vexa::camera::PtzPlace;

class NoPicture : public CDataSink {
 public:
  void Write(const unsigned char*, unsigned int) override {}
};

/// Camera and driver of a model; what moves is there at once.
class ModelAtWork : private ModelCamera {
 public:
  explicit ModelAtWork(const std::string& model) {
    vexa::camera::CameraOptions options;
    options.rtsp_port = 0;
    options.image_path = VEXA_CLIPS "/small.mjpeg";
    options.frames_per_second = 50;
    options.ptz_speed = 1e6;
    start_model(model, options, 0);
  }

  CLibraryDevice* operator->() { return device_.get(); }
  vexa::camera::VirtualCamera& camera() { return *camera_; }
  const SLibDFixedPTZControlInfo& control() const { return profile_.control; }
  bool has_focus() const { return profile_.control.focus.maxPosition != 0; }
  bool can_turn() const { return profile_.camera.electronicFlip == 1; }
  PtzPlace place() { return camera_->ptz()->place(std::chrono::steady_clock::now()); }
  CameraPose pose() { return camera_->pose().value_or(CameraPose()); }
  std::size_t requests() { return camera_->journal().snapshot().size(); }

  /// JPEG over HTTP, upright or turned by 180 degrees.
  void stream(bool turned) {
    SLibDCameraInfo video;
    ASSERT_EQ(device_->GetCameraInfo(video), LIBD_OK);
    SLibDFixedCameraInfo offer;
    ASSERT_EQ(device_->GetFixedCameraInfo(offer), LIBD_OK);
    for (const SLibDVideoCodecInfo& codec : offer.codecs) {
      if (codec.name != "JPEG") continue;
      video.codecName = codec.name;
      video.imageWidth = codec.resolutions.back().width;
      video.imageHeight = codec.resolutions.back().height;
      video.frameRate = codec.frameRates.back().value;
      video.quality = codec.qualities.front().value;
    }
    video.rotation = turned ? 180 : 0;
    ASSERT_EQ(device_->SetCameraInfo(video), LIBD_OK);
    ASSERT_EQ(device_->StartVideoStreaming(), LIBD_OK);
  }

  /// The position in the pictures, once it is the camera's own.
  SLibDPTZStatus seen() {
    SLibDPTZStatus status;
    NoPicture sink;
    SLibDVideoFrameInfo frame;
    frame.sink = &sink;
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(10);
    while (std::chrono::steady_clock::now() < deadline) {
      device_->GetCurrentVideoFrame(frame);
      if (device_->GetCurrentPosition(status) == LIBD_OK && agrees(status)) break;
      poll(nullptr, 0, 2);
    }
    return status;
  }

  void expect_seen(const char* after) {
    const SLibDPTZStatus status = seen();
    EXPECT_TRUE(agrees(status)) << after << ": told " << status.panPosition << " " << status.tiltPosition << " "
                                << status.horizontalAngle << ", looks to " << pose().pan << " " << pose().tilt << " "
                                << pose().horizontal_angle;
  }

 private:
  /// Within the last digit: thousandths of a degree, and ten-thousandths of one as viewing angles count.
  bool agrees(const SLibDPTZStatus& status) {
    const CameraPose pose = this->pose();
    return std::abs(status.panPosition - pose.pan * 1000) < 1 && std::abs(status.tiltPosition - pose.tilt * 1000) < 1 &&
           std::abs(status.horizontalAngle - pose.horizontal_angle * 10000) <
               1 + pose.horizontal_angle;  // the driver cuts the magnification to four digits
  }
};

std::vector<std::string> moving_models() {
  std::vector<std::string> names;
  for (const std::string& name : vexa::ProfileNames()) {
    if ((installed_profile(name).cameraTypes & vexa::kPtzCamera) != 0) names.push_back(name);
  }
  return names;
}

/// Where a share of 10000 of a way leads, counted apart from the driver.
int share_of(long long share, long long from, long long to) {
  return static_cast<int>(from + share * (to - from) / 10000);
}

class PtzLoop : public testing::TestWithParam<std::string> {};

void go_and_see(ModelAtWork& model) {
  const SLibDFixedPTZControlInfo& control = model.control();
  const SLibDFixedPanTiltInfo& turn = control.panTilt;
  const struct {
    int pan, tilt, zoom;
  } places[] = {{0, 0, 10000}, {10000, 10000, 0}, {5000, 1429, 4321}, {7, 9999, 77}};
  for (const auto& place : places) {
    SCOPED_TRACE(std::to_string(place.pan) + " " + std::to_string(place.tilt) + " " + std::to_string(place.zoom));
    ASSERT_EQ(model->PanTiltAbsolute(place.pan, place.tilt), LIBD_OK);
    ASSERT_EQ(model->ZoomAbsolute(place.zoom), LIBD_OK);
    model.expect_seen("moved");
    const PtzPlace there = model.place();
    EXPECT_NEAR(there[0], share_of(place.pan, turn.panOrigin, turn.panOrigin + turn.panSpan / 2), 1);
    EXPECT_NEAR(there[1], share_of(place.tilt, turn.tiltOrigin, turn.tiltOrigin + turn.tiltSpan / 2), 1);
    EXPECT_EQ(there[2], share_of(place.zoom, control.zoom.minPosition, control.zoom.maxPosition));
  }
}

void recall_and_see(ModelAtWork& model) {
  SLibDPresetInfo preset;
  preset.index = model.control().presetCount - 1;
  preset.name = "last";
  ASSERT_EQ(model->PanTiltAbsolute(1234, 4321), LIBD_OK);
  ASSERT_EQ(model->ZoomAbsolute(5555), LIBD_OK);
  model.expect_seen("before it is set");
  const PtzPlace set = model.place();
  ASSERT_EQ(model->SetPreset(preset), LIBD_OK);
  ASSERT_EQ(model->PanTiltAbsolute(0, 0), LIBD_OK);
  model.expect_seen("away from it");
  EXPECT_NE(model.place(), set);
  ASSERT_EQ(model->RecallPreset(preset.index), LIBD_OK);
  model.expect_seen("recalled");
  EXPECT_EQ(model.place(), set);
}

TEST_P(PtzLoop, WhatThePicturesTellIsWhereTheCameraLooks) {
  for (const bool turned : {false, true}) {
    ModelAtWork model(GetParam());
    if (turned && !model.can_turn()) continue;
    SCOPED_TRACE(turned ? "turned" : "upright");
    ASSERT_NO_FATAL_FAILURE(model.stream(turned));
    ASSERT_NO_FATAL_FAILURE(go_and_see(model));
    ASSERT_NO_FATAL_FAILURE(recall_and_see(model));
    EXPECT_EQ(model->StopVideoStreaming(), LIBD_OK);
  }
}

TEST_P(PtzLoop, HostPositionsReachBothEndsOfTheModel) {
  ModelAtWork model(GetParam());
  ASSERT_EQ(model->PanTiltAbsolute(0, 0), LIBD_OK);
  EXPECT_NEAR(model.pose().pan, -180, 0.01);
  EXPECT_NEAR(model.pose().tilt, -15, 0.01);
  ASSERT_EQ(model->PanTiltAbsolute(10000, 10000), LIBD_OK);
  EXPECT_NEAR(model.pose().pan, 180, 0.01) << "full circle";
  EXPECT_NEAR(model.pose().tilt, 90, 0.01);
}

TEST_P(PtzLoop, TheCameraTakesEveryRequestOfTheDriver) {
  ModelAtWork model(GetParam());
  SLibDResolutionInfo picture;
  SLibDCameraInfo video;
  ASSERT_EQ(model->GetCameraInfo(video), LIBD_OK);
  picture.width = video.imageWidth;
  picture.height = video.imageHeight;
  for (const int speed : {-10000, -5000, 0, 5000, 10000}) {
    for (const int other : {-10000, 0, 7000}) EXPECT_EQ(model->PanTilt(speed, other), LIBD_OK) << speed << " " << other;
    EXPECT_EQ(model->Zoom(speed), LIBD_OK) << speed;
    EXPECT_EQ(model->Focus(speed), model.has_focus() ? LIBD_OK : LIBD_FAILED) << speed;
  }
  for (const int step : {-100, 0, 1, 100}) EXPECT_EQ(model->ZoomRelative(step), LIBD_OK) << step;
  for (const int place : {0, 1, 4999, 10000}) {
    EXPECT_EQ(model->PanTiltDirect(place, place, picture), LIBD_OK) << place;
    EXPECT_EQ(model->ZoomArea(place, 10000 - place, place, place, picture), LIBD_OK) << place;
    EXPECT_EQ(model->FocusAbsolute(place), model.has_focus() ? LIBD_OK : LIBD_FAILED) << place;
  }
}

TEST_P(PtzLoop, WhatTheModelLacksIsRefused) {
  ModelAtWork model(GetParam());
  EXPECT_EQ(model->SetFocusMode(true), model.has_focus() ? LIBD_OK : LIBD_FAILED);
  EXPECT_EQ(model->StopShadowTour(), model.control().shadowTourCount > 0 ? LIBD_OK : LIBD_FAILED);
  EXPECT_EQ(model->RecallPreset(0), LIBD_FAILED) << "it is not set";
}

TEST_P(PtzLoop, DirectionsAreThoseOfThePicture) {
  ModelAtWork model(GetParam());
  ASSERT_EQ(model->PanTilt(10000, 5000), LIBD_OK);
  EXPECT_NEAR(model.pose().pan, 180, 0.01);
  EXPECT_NEAR(model.pose().tilt, 90, 0.01);
  ASSERT_EQ(model->PanTilt(-5000, -10000), LIBD_OK);
  EXPECT_NEAR(model.pose().pan, -180, 0.01);
  EXPECT_NEAR(model.pose().tilt, -15, 0.01);
}

TEST_P(PtzLoop, ToursComeBackAsTheyWereSet) {
  ModelAtWork model(GetParam());
  SLibDCameraTourInfo tours;
  tours.enabled = true;
  tours.resumeTime = 45;
  for (int number = 1; number <= model.control().tourCount; ++number) {
    SLibDCameraTourEachSetting tour;
    tour.enabled = number == model.control().tourCount;
    tour.sequence = {number, 1, model.control().presetCount, 1};
    tour.stayTime = 10 + number;
    tour.speed = number;
    tours.tours.emplace(number, tour);
  }
  ASSERT_EQ(model->SetCameraTourInfo(tours), LIBD_OK);
  SLibDCameraTourInfo back;
  ASSERT_EQ(model->GetCameraTourInfo(back), LIBD_OK);
  EXPECT_TRUE(back.enabled);
  EXPECT_EQ(back.resumeTime, 45);
  ASSERT_EQ(back.tours.size(), tours.tours.size());
  for (const auto& [number, tour] : tours.tours) {
    EXPECT_EQ(back.tours[number].enabled, tour.enabled) << number;
    EXPECT_EQ(back.tours[number].sequence, tour.sequence) << number;
    EXPECT_EQ(back.tours[number].stayTime, tour.stayTime) << number;
    EXPECT_EQ(back.tours[number].speed, tour.speed) << number;
  }
}

std::string test_name(const testing::TestParamInfo<std::string>& model) {
  std::string name = model.param;
  std::erase(name, '-');
  return name;
}
INSTANTIATE_TEST_SUITE_P(Models, PtzLoop, testing::ValuesIn(moving_models()), test_name);

TEST(PtzShadowTours, ComeBackAsTheyWereSetAndRecorded) {
  ModelAtWork model("LMX-P200");
  ASSERT_EQ(model->StartRecordShadowTour(2), LIBD_OK);
  ASSERT_EQ(model->PanTiltAbsolute(9000, 9000), LIBD_OK);
  ASSERT_EQ(model->StopRecordShadowTour(), LIBD_OK);
  SLibDShadowTourInfo tours;
  tours.enabled = true;
  tours.resumeTime = 7;
  for (int number = 1; number <= 5; ++number) tours.tours[number].enabled = number == 2;
  ASSERT_EQ(model->SetShadowTourInfo(tours), LIBD_OK);
  SLibDShadowTourInfo back;
  ASSERT_EQ(model->GetShadowTourInfo(back), LIBD_OK);
  EXPECT_TRUE(back.enabled);
  EXPECT_EQ(back.resumeTime, 7);
  EXPECT_EQ(back.maxRecordTime, 60);
  ASSERT_EQ(back.tours.size(), 5U);
  for (const auto& [number, tour] : back.tours) {
    EXPECT_EQ(tour.enabled, number == 2) << number;
    EXPECT_EQ(tour.recordedTime > 0, number == 2) << number;
  }
  EXPECT_EQ(model->StartPreviewShadowTour(2), LIBD_OK);
  EXPECT_EQ(model->StopPreviewShadowTour(), LIBD_OK);
  EXPECT_EQ(model->StartPreviewShadowTour(1), LIBD_FAILED) << "nothing is recorded there";
  EXPECT_EQ(model->StartShadowTour(2), LIBD_OK);
  EXPECT_EQ(model->StopShadowTour(), LIBD_OK);
  ASSERT_EQ(model->GetShadowTourInfo(back), LIBD_OK);
  EXPECT_FALSE(back.enabled);
}

/// What a host makes of a name as the camera lists it.
std::string decoded(const std::string& name) {
  std::string bytes;
  for (std::size_t at = 0; at < name.size(); ++at) {
    if (name[at] != '%') {
      bytes += name[at];
      continue;
    }
    bytes += static_cast<char>(std::stoi(name.substr(at + 1, 2), nullptr, 16));
    at += 2;
  }
  return bytes;
}

TEST(PtzPresetNames, OfEveryByteComeBack) {
  ModelAtWork model("LMX-P200");
  std::array<std::string, 3> names = {"", "", "Main gate (T\xC3\xBCr)"};
  for (int byte = 0; byte < 256; ++byte) names[static_cast<std::size_t>(byte / 128)] += static_cast<char>(byte);
  for (std::size_t i = 0; i < names.size(); ++i) {
    SLibDPresetInfo preset;
    preset.index = static_cast<std::int32_t>(i);
    preset.name = names[i];
    ASSERT_EQ(model->SetPreset(preset), LIBD_OK) << i;
  }
  std::vector<SLibDPresetInfo> presets;
  ASSERT_EQ(model->GetPresets(presets), LIBD_OK);
  ASSERT_EQ(presets.size(), 256U);
  for (std::size_t i = 0; i < names.size(); ++i) EXPECT_EQ(decoded(presets[i].name), names[i]) << i;
  EXPECT_EQ(presets[2].name, names[2]) << "plain text needs no decoding";
  EXPECT_EQ(presets[3].name, "");
}

TEST(PtzPresetNames, AddNoHeaderAndNoSecondCommand) {
  ModelAtWork model("LMX-P200");
  const std::string names[] = {"a\r\nX-Header: 1",
                               "a\r\n\r\nGET /command/system.cgi?Reboot=1 HTTP/1.0\r\n\r\n",
                               "a,on&PresetClear=1",
                               "a HTTP/1.0",
                               std::string("a\0b", 3),
                               "../../command/system.cgi?Reboot=1#",
                               "100%%s%n"};
  for (const std::string& name : names) {
    SLibDPresetInfo preset;
    preset.name = name;
    const std::size_t before = model.requests();
    ASSERT_EQ(model->SetPreset(preset), LIBD_OK) << name;
    const auto requests = model.camera().journal().snapshot();
    ASSERT_EQ(requests.size(), before + 1) << name;
    const std::string& bytes = requests.back().bytes;
    EXPECT_EQ(bytes.find("\r\nAuthorization: Basic "), bytes.find('\r')) << bytes;
    EXPECT_EQ(bytes.find("\r\n\r\n"), bytes.size() - 4) << bytes;
    EXPECT_NE(bytes.find(",on HTTP/1.0\r\n"), std::string::npos) << bytes;
    std::vector<SLibDPresetInfo> presets;
    ASSERT_EQ(model->GetPresets(presets), LIBD_OK);
    EXPECT_EQ(decoded(presets[0].name), name);
  }
}

TEST(PtzPresetNames, TooLongForARequestSendNothing) {
  ModelAtWork model("LMX-P200");
  SLibDPresetInfo preset;
  preset.name = std::string(4096, 'n');
  EXPECT_EQ(model->SetPreset(preset), LIBD_FAILED);
  std::string text;
  model->GetLatestErrorText(text);
  EXPECT_EQ(text, "URL too long");
  EXPECT_EQ(model.requests(), 0U);
  preset.name = std::string(200, 'n');
  EXPECT_EQ(model->SetPreset(preset), LIBD_FAILED) << "the camera takes 128 bytes";
  EXPECT_EQ(model.requests(), 1U);
}

}  // namespace
}  // namespace vexa_test
