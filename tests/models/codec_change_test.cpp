// SPDX-License-Identifier: Apache-2.0
// A host that changes codec, size and rate of a running camera through the public interface alone.
#include <gtest/gtest.h>
#include <poll.h>

#include <chrono>
#include <string>
#include <vector>

#include "tests/support/decoder.h"
#include "tests/support/model_camera.h"

namespace vexa_test {
namespace {

/// What the virtual camera sends, with the decoder's name of it.
struct StreamedCodec {
  const char* name;
  const char* format;
};
constexpr StreamedCodec kStreamedCodecs[] = {{"JPEG", "mjpeg"}, {"MPEG4", "m4v"}, {"H.264", "h264"}};

struct CodecChoice {
  StreamedCodec codec;
  SLibDResolutionInfo size;
  int frame_rate;
  int rate;  // the bit rate; of JPEG the quality

  bool is_jpeg() const { return codec.name == std::string("JPEG"); }
};

class FrameBytes : public CDataSink {
 public:
  void Write(const unsigned char* data, unsigned int length) override {
    bytes.append(reinterpret_cast<const char*>(data), length);
    ++frames;
  }
  std::string bytes;
  std::size_t frames = 0;
};

class CodecChange : public testing::Test, protected ModelCamera {
 protected:
  void start(const std::string& model) {
    vexa::camera::CameraOptions options;
    options.speed = 5;
    options.hash_packets = false;
    start_model(model, options);
  }

  /// Every size of every codec that the camera streams, with rates that differ from one to the next.
  std::vector<CodecChoice> choices() {
    SLibDCameraInfo video;
    EXPECT_EQ(device_->GetCameraInfo(video), LIBD_OK);
    SLibDFixedCameraInfo offer;
    EXPECT_EQ(device_->GetFixedCameraInfo(offer), LIBD_OK);
    std::vector<CodecChoice> all;
    for (const SLibDVideoCodecInfo& codec : offer.codecs) {
      for (const StreamedCodec& streamed : kStreamedCodecs) {
        if (codec.name != streamed.name) continue;
        for (const SLibDResolutionInfo& size : codec.resolutions) {
          const std::size_t turn = all.size();
          const auto& frames = codec.frameRates;
          const auto& rates = codec.name == std::string("JPEG") ? codec.qualities : codec.bitRates;
          all.push_back({streamed, size, frames[frames.size() - 1 - turn % 3].value, rates[turn % rates.size()].value});
        }
      }
    }
    return all;
  }

  void change_to(const CodecChoice& choice) {
    SLibDCameraInfo video;
    ASSERT_EQ(device_->GetCameraInfo(video), LIBD_OK);
    video.codecName = choice.codec.name;
    video.imageWidth = choice.size.width;
    video.imageHeight = choice.size.height;
    video.frameRate = choice.frame_rate;
    (choice.is_jpeg() ? video.quality : video.bitRate) = choice.rate;
    ASSERT_EQ(device_->SetCameraInfo(video), LIBD_OK);
    ASSERT_EQ(device_->GetCameraInfo(video), LIBD_OK);
    EXPECT_EQ(video.imageSizeText, choice.size.text);
    EXPECT_EQ(video.frameRate, choice.frame_rate);
    EXPECT_EQ(video.codecName, choice.codec.name);
    EXPECT_EQ(choice.is_jpeg() ? video.quality : video.bitRate, choice.rate);
  }

  /// What the camera streams as it is set: at least `frames` frames, taken as they come.
  FrameBytes watch(std::size_t frames) {
    FrameBytes sink;
    EXPECT_EQ(device_->StartVideoStreaming(), LIBD_OK);
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(30);
    SLibDVideoFrameInfo frame;
    frame.sink = &sink;
    while (sink.frames < frames && std::chrono::steady_clock::now() < deadline) {
      if (device_->GetCurrentVideoFrame(frame) != LIBD_OK) poll(nullptr, 0, 2);
    }
    EXPECT_EQ(device_->StopVideoStreaming(), LIBD_OK);
    return sink;
  }
};

TEST_F(CodecChange, FiftyTimesInARowADecoderFindsWhatWasAskedFor) {
  start("LMX-H100");
  const std::vector<CodecChoice> all = choices();
  ASSERT_EQ(all.size(), 10U) << "JPEG and H.264 in four sizes of the captured shape, MPEG-4 in two";
  ASSERT_LE(all.size(), 50U) << "each must have its turn";
  for (std::size_t round = 0; round < 50; ++round) {
    const CodecChoice& choice = all[round % all.size()];
    SCOPED_TRACE("round " + std::to_string(round) + ": " + choice.size.text + " " + choice.codec.name);
    ASSERT_NO_FATAL_FAILURE(change_to(choice));
    const FrameBytes seen = watch(6);
    const Decoded decoded = decode(folder_.make_file("seen", seen.bytes), choice.codec.format);
    EXPECT_TRUE(decoded.flawless);
    EXPECT_EQ(decoded.frames, seen.frames);
    EXPECT_GE(decoded.frames, 6U);
    EXPECT_EQ(decoded.size, choice.size.text);
  }
}

TEST_F(CodecChange, TheCameraTakesEverySizeThatTheDriverOffersWhateverItsProperties) {
  const struct {
    const char* model;
    const char* key;
    const char* value;
  } cases[] = {{"LMX-H100", "VidCapSize", "1280,960"},  {"LMX-H100", "ImageMaxSize", "1280,720"},
               {"LMX-H100", "SolidPTZ", "on"},          {"LMX-M300", "SolidPTZ", "on"},
               {"LMX-M300", "VidCapSize", "1280,720"},  {"LMX-P200", "SolidPTZ", "on"},
               {"LMX-C100", "ImageMaxSize", "384,288"}, {"LMX-A100", "VidCapSize", "1280,720"},
               {"VX-2000", "VidCapSize", "1280,960"}};
  for (const auto& c : cases) {
    SCOPED_TRACE(std::string(c.model) + " " + c.key + "=" + c.value);
    start(c.model);
    ASSERT_TRUE(camera_->settings().apply("camera", std::string(c.key) + "=" + c.value));
    const std::vector<CodecChoice> all = choices();
    EXPECT_GE(all.size(), 1U);
    for (const CodecChoice& choice : all) ASSERT_NO_FATAL_FAILURE(change_to(choice)) << choice.size.text;
    camera_.reset();
  }
}

TEST_F(CodecChange, ASizeThatTheModelLacksIsRefusedAndNothingChanges) {
  start("LMX-H100");
  SLibDCameraInfo video;
  ASSERT_EQ(device_->GetCameraInfo(video), LIBD_OK);
  video.imageWidth = 1280;
  video.imageHeight = 1024;
  EXPECT_EQ(device_->SetCameraInfo(video), LIBD_FAILED);
  std::string text;
  device_->GetLatestErrorText(text);
  EXPECT_EQ(text, "Bad Request");
  ASSERT_EQ(device_->GetCameraInfo(video), LIBD_OK);
  EXPECT_EQ(video.imageSizeText, "1920x1080");
}

TEST_F(CodecChange, ReadingTheSettingsTakesOneConnection) {
  start("LMX-H100");
  SLibDCameraInfo video;
  ASSERT_EQ(device_->GetCameraInfo(video), LIBD_OK);
  const auto requests = camera_->journal().snapshot();
  ASSERT_EQ(requests.size(), 1U);
  EXPECT_EQ(requests[0].bytes.find("GET http://"), 0U);
  EXPECT_NE(requests[0].bytes.find("/command/inquiry.cgi?inq=camera HTTP/1.0\r\n"), std::string::npos);
}

TEST_F(CodecChange, AModelsExposureStepsReachTheCamera) {
  start("LMX-P100");
  std::string mode = "Shutter Priority";
  ASSERT_EQ(device_->SetBrightMode(mode), LIBD_OK);
  SLibDPTZControlInfo control;
  device_->GetPTZControlInfo(control);
  control.brightMode = mode;
  device_->SetPTZControlInfo(control);
  ASSERT_EQ(device_->BrightAbsolute(10000), LIBD_OK);
  EXPECT_EQ(camera_->settings().get("camera", "ExpMode"), "shutter");
  EXPECT_EQ(camera_->settings().get("camera", "Shutter"), "27");
  ASSERT_EQ(device_->Bright(-1), LIBD_OK);
  EXPECT_EQ(camera_->settings().get("camera", "Shutter"), "24");
}

}  // namespace
}  // namespace vexa_test
