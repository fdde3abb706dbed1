// SPDX-License-Identifier: Apache-2.0
// Every codec by every transport, from the encoder's pictures to a decoder that is not ours.
#include "tests/media/video_transports.h"

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

struct NamedTransport {
  const char* name;
  VideoTransport transport;
};

constexpr NamedTransport kDatagrams = {"Datagrams", VideoTransport::kUdp};
constexpr NamedTransport kRtspConnection = {"RtspConnection", VideoTransport::kInterleaved};
constexpr NamedTransport kHttpStream = {"Http", VideoTransport::kHttp};

class EveryCodecOverEveryTransport : public testing::TestWithParam<std::tuple<CodecClip, NamedTransport>> {
 protected:
  static constexpr std::size_t kFrames = 30;

  static const CodecClip& clip() { return std::get<0>(GetParam()); }
  static VideoTransport transport() { return std::get<1>(GetParam()).transport; }
};

TEST_P(EveryCodecOverEveryTransport, FramesAreTheEncodersAndDecodeWithoutComplaint) {
  const auto options = options_for_all_transports(clip().clip);
  const auto encoded = vexa::camera::ImageClip::load(options.image_path);
  LiveCamera camera(options);
  const std::vector<std::string> frames = frames_by(transport(), camera, kFrames);
  ASSERT_EQ(frames.size(), kFrames);
  const TemporaryFolder folder;
  std::ofstream file(folder / "frames", std::ios::binary);
  for (std::size_t i = 0; i < frames.size(); ++i) {
    if (transport() == VideoTransport::kHttp) {
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

std::string name_of_codec_and_transport(const testing::TestParamInfo<std::tuple<CodecClip, NamedTransport>>& tested) {
  return std::string(std::get<0>(tested.param).name) + "By" + std::get<1>(tested.param).name;
}

INSTANTIATE_TEST_SUITE_P(Of, EveryCodecOverEveryTransport,
                         testing::Combine(testing::ValuesIn(kCodecClips),
                                          testing::Values(kDatagrams, kRtspConnection, kHttpStream)),
                         name_of_codec_and_transport);
INSTANTIATE_TEST_SUITE_P(OfSlices, EveryCodecOverEveryTransport,
                         testing::Combine(testing::Values(kSlicedClip), testing::Values(kDatagrams, kRtspConnection)),
                         name_of_codec_and_transport);

}  // namespace
}  // namespace vexa_test
