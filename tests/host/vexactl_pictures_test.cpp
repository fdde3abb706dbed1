// SPDX-License-Identifier: Apache-2.0
// Pictures that vexactl makes: detection windows drawn on one, and those of alarms.
#include <array>
#include <cstdlib>
#include <filesystem>

#include "host/picture/picture_file.h"
#include "tests/host/camera_fixture.h"

namespace vexa_test {
namespace {

using vexa::host::FrameBytes;
using vexa::host::Picture;

constexpr int kClipWidth = 320;
constexpr int kClipHeight = 240;

class PicturesByCommand : public WithCamera {
 protected:
  void start_model(const std::string& model, const std::string& clip = "small.h264") {
    vexa::camera::CameraOptions options;
    options.profile_path = VEXA_SOURCE_DIR "/models/profiles/" + model + ".json";
    options.clip_path = VEXA_CLIPS "/" + clip;
    start_camera(options);
  }

  void set_a_window() {
    const ProgramResult result = run(
        {"detection", place(), "set", "--window", "2", "--area", "2500", "2500", "7500", "7500", "--enabled", "on"});
    ASSERT_EQ(result.exit_code, 0) << result.err;
  }

  // The only picture in the folder.
  std::string snapshot() {
    for (const auto& entry : std::filesystem::directory_iterator(folder().path())) {
      if (entry.path().extension() == ".jpg") return entry.path().string();
    }
    return "";
  }

  // Watches until one contact has closed.
  ProgramResult watch_one_alarm() {
    ProgramRun watch(folder(), vexactl({"watch", place(), "--count", "1", "--snapshot-dir", "."}), kCredentials);
    const bool watched = camera().journal().wait_for_count("/command/alarmdata.cgi", 1, std::chrono::seconds(30));
    EXPECT_TRUE(watched);
    if (!watched) watch.signal(SIGTERM);
    EXPECT_TRUE(camera().alarms().happen({vexa::camera::AlarmEvent::Kind::kContact, 1, 1}));
    return watch.wait();
  }
};

TEST_F(PicturesByCommand, MistakesAreRefusedBeforeTheCameraIsAsked) {
  start_model("LMX-P200");
  for (const std::vector<std::string>& arguments : {std::vector<std::string>{"detection", place(), "draw"},
                                                    {"detection", place(), "draw", "--out", "x.gif"},
                                                    {"detection", place(), "draw", "--out", "png"},
                                                    {"watch", place(), "--snapshot-dir", ""},
                                                    {"watch", place(), "--snapshot-dir", "missing"}}) {
    const ProgramResult result = run(arguments);
    EXPECT_EQ(result.exit_code, 1) << testing::PrintToString(arguments);
    EXPECT_NE(result.err, "");
  }
  EXPECT_TRUE(camera().journal().snapshot().empty());
}

// Its pictures need no decoder, in no build.
TEST_F(PicturesByCommand, AnAlarmOfAJpegCameraKeepsItsPictureAsItCame) {
  ASSERT_NO_FATAL_FAILURE(start_model("LMX-P200", "plain.mjpeg"));
  camera().settings().set("camera", "ImageCodec1", "jpeg");
  const ProgramResult result = watch_one_alarm();
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_THAT(snapshot(), testing::EndsWith("Z-input-1.jpg"));
  EXPECT_THAT(contents_of(snapshot()), testing::StartsWith("\xff\xd8"));
}

#ifdef VEXA_WITH_FFMPEG

Picture decoded(const std::string& file) {
  const std::string bytes = contents_of(file);
  const auto result = vexa::host::decode_picture(vexa::host::Codec::kJpeg, {FrameBytes(bytes.begin(), bytes.end())});
  return result.value_or(Picture());
}

// How far a pixel is from a colour.
int distance(const Picture& picture, int x, int y, std::array<int, 3> colour) {
  int sum = 0;
  for (std::size_t i = 0; i < 3; ++i) {
    sum += std::abs(picture.rgb[static_cast<std::size_t>(3 * (y * picture.width + x)) + i] - colour[i]);
  }
  return sum;
}

TEST_F(PicturesByCommand, DetectionWindowsAreDrawnOnThePresentPicture) {
  start_model("LMX-P200");
  ASSERT_NO_FATAL_FAILURE(set_a_window());
  const ProgramResult result = run({"detection", place(), "draw", "--out", "windows.jpg"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  const Picture picture = decoded(folder() / "windows.jpg");
  ASSERT_EQ(picture.width, kClipWidth);
  ASSERT_EQ(picture.height, kClipHeight);
  for (const auto& [x, y] : {std::pair{80, 120}, {240, 120}, {160, 60}, {160, 180}}) {
    EXPECT_LT(distance(picture, x, y, {64, 255, 64}), 60) << x << "," << y;
  }
  EXPECT_EQ(run({"detection", place(), "draw", "--out", "windows.png"}).exit_code, 0);
  EXPECT_THAT(contents_of(folder() / "windows.png"), testing::StartsWith("\x89PNG"));
}

TEST_F(PicturesByCommand, CtrlCEndsTheWaitForAPictureAndTheSession) {
  vexa::camera::CameraOptions options;
  options.profile_path = VEXA_SOURCE_DIR "/models/profiles/LMX-P200.json";
  options.packet_faults.loss = 1;
  start_camera(options);
  ASSERT_NO_FATAL_FAILURE(set_a_window());
  ProgramRun draw(folder(), vexactl({"detection", place(), "draw", "--out", "windows.png"}), kCredentials);
  // The first keep-alive comes when the session stands.
  ASSERT_TRUE(camera().journal().wait_for_count("GET_PARAMETER", 1, std::chrono::seconds(30)));
  draw.signal(SIGINT);
  const ProgramResult result = draw.wait();
  EXPECT_EQ(result.exit_code, 130);
  EXPECT_EQ(result.err, "vexactl: interrupted before a picture came\n  Nothing was written.\n");
  EXPECT_TRUE(camera().journal().wait_for_count("TEARDOWN", 1, std::chrono::seconds(30)));
}

TEST_F(PicturesByCommand, ACameraWithoutWindowsHasNoneToDraw) {
  start_model("LMX-M300");
  const ProgramResult result = run({"detection", place(), "draw", "--out", "windows.png"});
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_EQ(result.err,
            "vexactl: the camera has no detection windows of number 99\n"
            "  vexactl detection CAMERA show shows what it has.\n");
  EXPECT_EQ(contents_of(folder() / "windows.png"), "");
}

TEST_F(PicturesByCommand, AnAlarmHasThePictureOfItsMoment) {
  start_model("LMX-P200");
  const ProgramResult result = watch_one_alarm();
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_THAT(snapshot(), testing::EndsWith("Z-input-1.jpg"));
  EXPECT_EQ(decoded(snapshot()).width, kClipWidth);
}

#else

TEST_F(PicturesByCommand, DrawingIsRefusedByABuildThatCannot) {
  start_model("LMX-P200");
  const ProgramResult result = run({"detection", place(), "draw", "--out", "windows.png"});
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_THAT(result.err, testing::StartsWith("vexactl: this vexactl was built without FFmpeg's libraries; "));
  EXPECT_EQ(run({"watch", place(), "--snapshot-dir", "."}).exit_code, 1);
}

#endif

}  // namespace
}  // namespace vexa_test
