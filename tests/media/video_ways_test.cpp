// Every codec by every way, from the encoder's pictures to a decoder that is not ours.
#include "tests/media/video_ways.h"

#include <gtest/gtest.h>

#include <fstream>
#include <tuple>

#include "tests/support/decoder.h"
#include "tests/support/temporary_folder.h"

namespace vexa_test {
namespace {

struct CodecClip {
  const char* name;
  const char* clip;
  const char* format;  ///< as ffmpeg calls it
};

constexpr CodecClip kCodecClips[] = {{"Jpeg", "plain.mjpeg", "mjpeg"},
                                     {"JpegWithRestarts", "restart.mjpeg", "mjpeg"},
                                     {"Mpeg4", "small.m4v", "m4v"},
                                     {"H264", "small.h264", "h264"}};
/// Over HTTP each slice is a frame.
constexpr CodecClip kSlicedClip = {"H264InSlices", "slices.h264", "h264"};

struct NamedWay {
  const char* name;
  VideoWay way;
};

constexpr NamedWay kDatagrams = {"Datagrams", VideoWay::kUdp};
constexpr NamedWay kRtspConnection = {"RtspConnection", VideoWay::kInterleaved};
constexpr NamedWay kHttpStream = {"Http", VideoWay::kHttp};

class EveryCodecByEveryWay : public testing::TestWithParam<std::tuple<CodecClip, NamedWay>> {
 protected:
  static constexpr std::size_t kFrames = 30;

  static const CodecClip& clip() { return std::get<0>(GetParam()); }
  static VideoWay way() { return std::get<1>(GetParam()).way; }
};

TEST_P(EveryCodecByEveryWay, FramesAreTheEncodersAndADecoderHasNothingToSay) {
  const auto options = options_of_every_way(clip().clip);
  const auto encoded = vexa::camera::ImageClip::load(options.image_path);
  LiveCamera camera(options);
  const std::vector<std::string> frames = frames_by(way(), camera, kFrames);
  ASSERT_EQ(frames.size(), kFrames);
  const TemporaryFolder folder;
  std::ofstream file(folder / "frames", std::ios::binary);
  for (std::size_t i = 0; i < frames.size(); ++i) {
    if (way() == VideoWay::kHttp) {
      ASSERT_TRUE(frames[i] == without_user_data(encoded->kind(), encoded->pictures()[i])) << i;
    } else {
      ASSERT_TRUE(camera.sent(i, frames[i])) << i;
    }
    file << frames[i];
  }
  file.close();
  const Decoded decoded = decode(folder / "frames", clip().format);
  EXPECT_TRUE(decoded.flawless);
  EXPECT_TRUE(decoded.silent);
  EXPECT_EQ(decoded.frames, kFrames);
  EXPECT_EQ(decoded.size, "320x240");
}

std::string name_of_codec_and_way(const testing::TestParamInfo<std::tuple<CodecClip, NamedWay>>& tested) {
  return std::string(std::get<0>(tested.param).name) + "By" + std::get<1>(tested.param).name;
}

INSTANTIATE_TEST_SUITE_P(Of, EveryCodecByEveryWay,
                         testing::Combine(testing::ValuesIn(kCodecClips),
                                          testing::Values(kDatagrams, kRtspConnection, kHttpStream)),
                         name_of_codec_and_way);
INSTANTIATE_TEST_SUITE_P(OfSlices, EveryCodecByEveryWay,
                         testing::Combine(testing::Values(kSlicedClip), testing::Values(kDatagrams, kRtspConnection)),
                         name_of_codec_and_way);

}  // namespace
}  // namespace vexa_test
