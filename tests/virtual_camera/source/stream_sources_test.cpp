// SPDX-License-Identifier: Apache-2.0
// What the streams of a camera send as they are set.
#include "virtual_camera/source/stream_sources.h"

#include <gtest/gtest.h>

#include <chrono>
#include <memory>
#include <string>
#include <utility>
#include <variant>

#include "virtual_camera/model/camera_profile.h"
#include "virtual_camera/model/setting_rules.h"
#include "virtual_camera/source/clip_source.h"

namespace vexa::camera {
namespace {

/// A camera that does not run.
struct IdleCamera {
  explicit IdleCamera(CameraOptions of, PoseSource pose = nullptr)
      : options(std::move(of)),
        scene(settings, alarms, stage, std::move(pose), nullptr),
        sources(options, settings, scene) {
    if (options.profile) settings.obey(options.profile);
  }

  CameraOptions options;
  SettingsStore settings;
  AlarmScene alarms{AlarmLayout{}};
  SceneStage stage;
  LiveScene scene;
  StreamSources sources;
};

CameraOptions of_profile(const std::string& model) {
  CameraOptions options;
  auto profile = load_camera_profile(VEXA_SOURCE_DIR "/models/profiles/" + model + ".json");
  options.profile = std::make_shared<const SettingRules>(std::get<CameraProfile>(std::move(profile)));
  return options;
}

TEST(StreamSources, FollowsTheSettingsOfTheStream) {
  IdleCamera camera(of_profile("LMX-H100"));
  SettingsStore& settings = camera.settings;
  ASSERT_TRUE(settings.apply("camera", "ImageCodec1=h264&ImageSize1=320,192&FrameRate1=10&BitRate1=512"));
  const auto plan = camera.sources.plan(1);
  ASSERT_TRUE(plan && plan->source);
  EXPECT_EQ(plan->source->format().codec, Codec::kH264);
  EXPECT_EQ(plan->source->format().frames_per_second, 10);
  EXPECT_EQ(stream_settings(settings, 1)->width, 320);
  EXPECT_EQ(stream_settings(settings, 1)->height, 192);
  ASSERT_TRUE(settings.apply("camera", "ImageCodec2=off"));
  EXPECT_FALSE(camera.sources.plan(2)) << "switched off";
  EXPECT_FALSE(camera.sources.plan(3)) << "not there";
  EXPECT_EQ(camera.sources.open_images(2), nullptr) << "switched off";
  EXPECT_EQ(camera.sources.open_images(3), nullptr) << "not there";
}

TEST(StreamSources, DrawsInEveryCodecOfTheSettings) {
  IdleCamera camera(of_profile("LMX-H100"));
  const struct {
    const char* command;
    Codec codec;
  } cases[] = {{"ImageCodec1=jpeg&ImageSize1=640,368&FrameRate1=5&Quality1=5", Codec::kJpeg},
               {"ImageCodec1=mpeg4&ImageSize1=640,368&FrameRate1=5&BitRate1=512", Codec::kMpeg4},
               {"ImageCodec1=h264&ImageSize1=640,368&FrameRate1=5&BitRate1=512", Codec::kH264}};
  for (const auto& c : cases) {
    ASSERT_TRUE(camera.settings.apply("camera", c.command)) << c.command;
    const auto plan = camera.sources.plan(1);
    ASSERT_TRUE(plan && plan->source) << c.command;
    const auto images = camera.sources.open_images(1);
    ASSERT_NE(images, nullptr) << c.command;
    for (const PictureSource* source : {plan->source.get(), images.get()}) {
      EXPECT_EQ(source->format().codec, c.codec) << c.command;
      EXPECT_EQ(source->format().frames_per_second, 5) << c.command;
    }
  }
}

TEST(StreamSources, WithoutAProfileIsTheClip) {
  CameraOptions options;
  IdleCamera silent(options);
  const auto nothing = silent.sources.plan(7);
  ASSERT_TRUE(nothing);
  EXPECT_EQ(nothing->source, nullptr);
  EXPECT_EQ(silent.sources.open_images(7), nullptr);
  options.clip = PacketisedClip::load(VEXA_CLIPS "/small.m4v", 1400);
  options.images = ImageClip::load(VEXA_CLIPS "/small.mjpeg");
  options.frames_per_second = 7;
  IdleCamera camera(options);
  const auto plan = camera.sources.plan(7);
  ASSERT_TRUE(plan && plan->source);
  EXPECT_EQ(plan->source->format().codec, Codec::kMpeg4);
  EXPECT_EQ(plan->source->format().frames_per_second, 7);
  const auto images = camera.sources.open_images(7);
  ASSERT_NE(images, nullptr);
  EXPECT_EQ(images->format().codec, Codec::kJpeg);
}

TEST(StreamSources, UserDataAreTheOptionsOrWhereTheCameraLooks) {
  CameraOptions options;
  EXPECT_EQ(IdleCamera(options).sources.present_user_data(), "");
  int calls = 0;
  const auto pose = [&calls](std::chrono::steady_clock::time_point) {
    return CameraPose{0, 0, 60, "CamPos: " + std::to_string(++calls)};
  };
  const IdleCamera moving(options, pose);
  EXPECT_EQ(moving.sources.present_user_data(), "CamPos: 1");
  EXPECT_EQ(moving.sources.present_user_data(), "CamPos: 2");
  options.user_data = "CamPos: fixed";
  EXPECT_EQ(IdleCamera(options, pose).sources.present_user_data(), "CamPos: fixed");
}

TEST(ClipSource, HandsOutEveryPictureWithItsTimeWithoutACopy) {
  const auto clip = PacketisedClip::load(VEXA_CLIPS "/small.h264", 1400);
  ClipSource source(clip, 10, ClipSource::AtEnd::kStop);
  std::size_t keys = 0;
  for (std::size_t i = 0; i < clip->pictures().size(); ++i) {
    ASSERT_FALSE(source.ended());
    const auto picture = source.next();
    ASSERT_TRUE(picture);
    EXPECT_EQ(picture->bytes.get(), &clip->images().pictures()[i]);
    EXPECT_EQ(picture->packets.get(), &clip->pictures()[i]);
    EXPECT_EQ(picture->place, i);
    EXPECT_EQ(picture->key, clip->is_key(i));
    EXPECT_EQ(picture->due, std::chrono::milliseconds(100 * i));
    EXPECT_EQ(picture->stamp, picture->due);
    keys += picture->key ? 1 : 0;
  }
  EXPECT_EQ(keys, 10U);
  EXPECT_TRUE(source.ended());
  EXPECT_FALSE(source.next());
}

}  // namespace
}  // namespace vexa::camera
