// SPDX-License-Identifier: Apache-2.0
// Pictures decoded from video and written as files.
#include "host/picture/picture_file.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>

#include "host/picture/picture_decoder.h"
#include "tests/support/temporary_folder.h"
#include "virtual_camera/codec/image_clip.h"

namespace vexa::host {
namespace {

TEST(PictureFile, FormatGoesByTheEndOfTheName) {
  const struct {
    const char* file;
    std::optional<PictureFormat> format;
  } cases[] = {{"a.png", PictureFormat::kPng},
               {"a.jpg", PictureFormat::kJpeg},
               {"a.jpeg", PictureFormat::kJpeg},
               {"a.b.PNG", PictureFormat::kPng},
               {"/x/a.JpG", PictureFormat::kJpeg},
               {"a.gif", std::nullopt},
               {"png", std::nullopt},
               {".png", std::nullopt},
               {"a.pngx", std::nullopt},
               {"", std::nullopt}};
  for (const auto& one : cases) EXPECT_EQ(picture_format_of(one.file), one.format) << one.file;
}

#ifdef VEXA_WITH_FFMPEG

// Soft colours, which JPEG keeps closely.
Picture colour_slope(int width, int height) {
  Picture picture{width, height, {}};
  for (int y = 0; y < height; ++y) {
    for (int x = 0; x < width; ++x) {
      for (const int value : {255 * x / width, 255 * y / height, 128}) {
        picture.rgb.push_back(static_cast<std::uint8_t>(value));
      }
    }
  }
  return picture;
}

// What the ffmpeg program makes of a file.
std::string rgb_by_ffmpeg(const std::string& file, const std::string& options) {
  const vexa_test::TemporaryFolder folder;
  const std::string command =
      "ffmpeg -v error -i " + file + " " + options + " -f rawvideo -pix_fmt rgb24 " + folder.path() + "/rgb </dev/null";
  EXPECT_EQ(std::system(command.c_str()), 0);  // NOLINT(concurrency-mt-unsafe): this test has one thread
  return vexa_test::contents_of(folder / "rgb");
}

TEST(PictureFile, JpegComesBackWithinItsLoss) {
  for (const int width : {64, 37}) {
    const Picture picture = colour_slope(width, 48);
    const auto file = encode_picture(picture, PictureFormat::kJpeg);
    ASSERT_TRUE(file);
    const auto back = decode_picture(Codec::kJpeg, {*file});
    ASSERT_TRUE(back) << back.error().text;
    const auto& decoded = *back;
    ASSERT_EQ(decoded.width, width);
    ASSERT_EQ(decoded.height, 48);
    ASSERT_EQ(decoded.rgb.size(), picture.rgb.size());
    for (std::size_t i = 0; i < picture.rgb.size(); ++i) {
      ASSERT_NEAR(decoded.rgb[i], picture.rgb[i], 12) << "byte " << i;
    }
  }
}

TEST(PictureFile, PngKeepsEveryByte) {
  const vexa_test::TemporaryFolder folder;
  const Picture picture = colour_slope(37, 48);
  const auto file = encode_picture(picture, PictureFormat::kPng);
  ASSERT_TRUE(file);
  const auto& bytes = *file;
  folder.make_file("a.png", std::string(bytes.begin(), bytes.end()));
  EXPECT_EQ(rgb_by_ffmpeg(folder / "a.png", ""), std::string(picture.rgb.begin(), picture.rgb.end()));
}

TEST(PictureDecoder, ComesToThePictureOfTheLastFrame) {
  constexpr std::size_t kPictures = 3;
  const struct {
    Codec codec;
    const char* clip;
  } cases[] = {{Codec::kJpeg, VEXA_CLIPS "/small.mjpeg"},
               {Codec::kMpeg4, VEXA_CLIPS "/small.m4v"},
               {Codec::kH264, VEXA_CLIPS "/small.h264"}};
  for (const auto& one : cases) {
    SCOPED_TRACE(one.clip);
    const auto clip = vexa::camera::ImageClip::load(one.clip);
    ASSERT_TRUE(clip);
    std::vector<FrameBytes> frames;
    for (std::size_t i = 0; i < kPictures; ++i) {
      const std::string& picture = clip->pictures().at(i);
      frames.emplace_back(picture.begin(), picture.end());
    }
    const auto result = decode_picture(one.codec, frames);
    ASSERT_TRUE(result) << result.error().text;
    const auto& rgb = result->rgb;
    const std::string wanted = rgb_by_ffmpeg(one.clip, "-vf 'select=eq(n\\,2)' -frames:v 1");
    ASSERT_EQ(rgb.size(), wanted.size());
    int furthest = 0;
    for (std::size_t i = 0; i < rgb.size(); ++i) {
      furthest = std::max(furthest, std::abs(rgb[i] - static_cast<std::uint8_t>(wanted[i])));
    }
    EXPECT_LE(furthest, 4);  // roundings of the change of colours
  }
}

TEST(PictureDecoder, ReportsWhatIsNoPicture) {
  const FrameBytes noise(1000, 0x5a);
  for (const Codec codec : {Codec::kJpeg, Codec::kMpeg4, Codec::kH264}) {
    for (const auto& frames : {std::vector<FrameBytes>{}, {FrameBytes{}}, {noise}, {noise, FrameBytes{}, noise}}) {
      const auto result = decode_picture(codec, frames);
      ASSERT_FALSE(result) << name_of(codec);
      EXPECT_EQ(result.error().code, ExitCode::kNoVideo);
    }
  }
  EXPECT_EQ(decode_picture(Codec::kH264, {}).error().text,
            "the camera's H.264 picture cannot be decoded: it holds no picture");
}

std::string stated_by(Codec codec, const char* clip_path) {
  const auto clip = vexa::camera::ImageClip::load(clip_path);
  if (!clip) return "no clip";
  const std::string& picture = clip->pictures().front();
  const auto stream = read_stream_parameters(codec, FrameBytes(picture.begin(), picture.end()));
  if (!stream) return stream.error().text;
  return std::to_string(stream->width) + "x" + std::to_string(stream->height) + "@" +
         std::to_string(static_cast<int>(stream->frame_rate * 1000));
}

TEST(StreamParameters, AreReadFromAKeyPictureOfEachCodec) {
  EXPECT_EQ(stated_by(Codec::kH264, VEXA_CLIPS "/small.h264"), "320x240@25000");
  EXPECT_EQ(stated_by(Codec::kH264, VEXA_CLIPS "/low2m.h264"), "640x480@25000");
  EXPECT_EQ(stated_by(Codec::kH264, VEXA_CLIPS "/hd.h264"), "1920x1080@25000");
  // The rates of these codecs' headers are no frame rates.
  EXPECT_EQ(stated_by(Codec::kMpeg4, VEXA_CLIPS "/small.m4v"), "320x240@0");
  EXPECT_EQ(stated_by(Codec::kJpeg, VEXA_CLIPS "/small.mjpeg"), "320x240@0");
}

TEST(StreamParameters, OfACutPictureAreReadOrRefused) {
  const auto clip = vexa::camera::ImageClip::load(VEXA_CLIPS "/small.h264");
  ASSERT_TRUE(clip);
  const std::string& picture = clip->pictures().front();
  for (std::size_t length = 0; length < picture.size(); length += length < 64 ? 1 : 997) {
    const auto stream = read_stream_parameters(
        Codec::kH264, FrameBytes(picture.begin(), picture.begin() + static_cast<std::ptrdiff_t>(length)));
    if (!stream) {
      EXPECT_EQ(stream.error().code, ExitCode::kNoVideo) << length;
      continue;
    }
    EXPECT_EQ(stream->width, 320) << length;
    EXPECT_EQ(stream->height, 240) << length;
  }
}

#else

TEST(PictureDecoder, RefusesWithoutFfmpegAndReportsWhatToDo) {
  const auto result = decode_picture(Codec::kH264, {});
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().code, ExitCode::kUsage);
  EXPECT_EQ(result.error().text, "this vexactl was built without FFmpeg's libraries; decoding H.264 needs them");
  EXPECT_FALSE(encode_picture({}, PictureFormat::kPng));
}

#endif

}  // namespace
}  // namespace vexa::host
