// What the streams of a camera send as they are set.
#include "virtual_camera/source/stream_plan.h"

#include <gtest/gtest.h>

#include <chrono>
#include <string>
#include <utility>

#include "virtual_camera/source/clip_source.h"

namespace vexa::camera {
namespace {

/// A camera that does not run.
struct IdleCamera {
  explicit IdleCamera(CameraOptions options) : state(std::move(options), context) {}

  asio::io_context context;
  CameraState state;
};

CameraOptions of_profile(const std::string& model) {
  CameraOptions options;
  options.profile_path = VEXA_SOURCE_DIR "/models/profiles/" + model + ".json";
  return options;
}

TEST(StreamPlan, FollowsTheSettingsOfTheStream) {
  IdleCamera camera(of_profile("LMX-H100"));
  SettingsStore& settings = camera.state.settings;
  ASSERT_TRUE(settings.apply("camera", "ImageCodec1=h264&ImageSize1=320,192&FrameRate1=10&BitRate1=512"));
  const auto plan = plan_stream(camera.state, 1);
  ASSERT_TRUE(plan && plan->source);
  EXPECT_EQ(plan->source->format().codec, ImageKind::kH264);
  EXPECT_EQ(plan->source->format().frames_per_second, 10);
  EXPECT_EQ(stream_settings(settings, 1)->width, 320);
  EXPECT_EQ(stream_settings(settings, 1)->height, 192);
  ASSERT_TRUE(settings.apply("camera", "ImageCodec2=off"));
  EXPECT_FALSE(plan_stream(camera.state, 2)) << "switched off";
  EXPECT_FALSE(plan_stream(camera.state, 3)) << "not there";
  EXPECT_EQ(plan_images(camera.state, 2), nullptr) << "switched off";
  EXPECT_EQ(plan_images(camera.state, 3), nullptr) << "not there";
}

TEST(StreamPlan, DrawsInEveryCodecOfTheSettings) {
  IdleCamera camera(of_profile("LMX-H100"));
  const struct {
    const char* command;
    ImageKind codec;
  } cases[] = {{"ImageCodec1=jpeg&ImageSize1=640,368&FrameRate1=5&Quality1=5", ImageKind::kJpeg},
               {"ImageCodec1=mpeg4&ImageSize1=640,368&FrameRate1=5&BitRate1=512", ImageKind::kMpeg4},
               {"ImageCodec1=h264&ImageSize1=640,368&FrameRate1=5&BitRate1=512", ImageKind::kH264}};
  for (const auto& c : cases) {
    ASSERT_TRUE(camera.state.settings.apply("camera", c.command)) << c.command;
    const auto plan = plan_stream(camera.state, 1);
    ASSERT_TRUE(plan && plan->source) << c.command;
    const auto images = plan_images(camera.state, 1);
    ASSERT_NE(images, nullptr) << c.command;
    for (const PictureSource* source : {plan->source.get(), images.get()}) {
      EXPECT_EQ(source->format().codec, c.codec) << c.command;
      EXPECT_EQ(source->format().frames_per_second, 5) << c.command;
    }
  }
}

TEST(StreamPlan, WithoutAProfileIsTheClip) {
  CameraOptions options;
  IdleCamera silent(options);
  const auto nothing = plan_stream(silent.state, 7);
  ASSERT_TRUE(nothing);
  EXPECT_EQ(nothing->source, nullptr);
  EXPECT_EQ(plan_images(silent.state, 7), nullptr);
  options.clip = PacketisedClip::load(VEXA_CLIPS "/small.m4v", 1400);
  options.images = ImageClip::load(VEXA_CLIPS "/small.mjpeg");
  options.frames_per_second = 7;
  IdleCamera camera(options);
  const auto plan = plan_stream(camera.state, 7);
  ASSERT_TRUE(plan && plan->source);
  EXPECT_EQ(plan->source->format().codec, ImageKind::kMpeg4);
  EXPECT_EQ(plan->source->format().frames_per_second, 7);
  const auto images = plan_images(camera.state, 7);
  ASSERT_NE(images, nullptr);
  EXPECT_EQ(images->format().codec, ImageKind::kJpeg);
}

TEST(StreamPlan, UserDataAreTheOptionsOrWhereTheCameraLooks) {
  CameraOptions options;
  IdleCamera still(options);
  EXPECT_EQ(present_user_data(still.state), "");
  int calls = 0;
  still.state.pose = [&calls](std::chrono::steady_clock::time_point) {
    return CameraPose{0, 0, 60, "CamPos: " + std::to_string(++calls)};
  };
  EXPECT_EQ(present_user_data(still.state), "CamPos: 1");
  EXPECT_EQ(present_user_data(still.state), "CamPos: 2");
  options.user_data = "CamPos: fixed";
  IdleCamera fixed(options);
  fixed.state.pose = still.state.pose;
  EXPECT_EQ(present_user_data(fixed.state), "CamPos: fixed");
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
