// Pictures decoded from video and written as files.
#include "host/picture_file.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>

#include "host/picture_decoder.h"
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
    ASSERT_TRUE(std::holds_alternative<std::vector<std::uint8_t>>(file));
    const auto back = decode_picture("JPEG", {std::get<std::vector<std::uint8_t>>(file)});
    ASSERT_TRUE(std::holds_alternative<Picture>(back)) << std::get<Problem>(back).text;
    const auto& decoded = std::get<Picture>(back);
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
  ASSERT_TRUE(std::holds_alternative<std::vector<std::uint8_t>>(file));
  const auto& bytes = std::get<std::vector<std::uint8_t>>(file);
  folder.make_file("a.png", std::string(bytes.begin(), bytes.end()));
  EXPECT_EQ(rgb_by_ffmpeg(folder / "a.png", ""), std::string(picture.rgb.begin(), picture.rgb.end()));
}

TEST(PictureDecoder, ComesToThePictureOfTheLastFrame) {
  constexpr std::size_t kPictures = 3;
  const struct {
    const char* codec;
    const char* clip;
  } cases[] = {
      {"JPEG", VEXA_CLIPS "/small.mjpeg"}, {"MPEG4", VEXA_CLIPS "/small.m4v"}, {"H.264", VEXA_CLIPS "/small.h264"}};
  for (const auto& one : cases) {
    SCOPED_TRACE(one.codec);
    const auto clip = vexa::camera::ImageClip::load(one.clip);
    ASSERT_TRUE(clip);
    std::vector<FrameBytes> frames;
    for (std::size_t i = 0; i < kPictures; ++i) {
      const std::string& picture = clip->pictures().at(i);
      frames.emplace_back(picture.begin(), picture.end());
    }
    const auto result = decode_picture(one.codec, frames);
    ASSERT_TRUE(std::holds_alternative<Picture>(result)) << std::get<Problem>(result).text;
    const auto& rgb = std::get<Picture>(result).rgb;
    const std::string wanted = rgb_by_ffmpeg(one.clip, "-vf 'select=eq(n\\,2)' -frames:v 1");
    ASSERT_EQ(rgb.size(), wanted.size());
    int furthest = 0;
    for (std::size_t i = 0; i < rgb.size(); ++i) {
      furthest = std::max(furthest, std::abs(rgb[i] - static_cast<std::uint8_t>(wanted[i])));
    }
    EXPECT_LE(furthest, 4);  // roundings of the change of colours
  }
}

TEST(PictureDecoder, TellsWhatIsNoPicture) {
  const FrameBytes noise(1000, 0x5a);
  for (const char* codec : {"JPEG", "MPEG4", "H.264"}) {
    for (const auto& frames : {std::vector<FrameBytes>{}, {FrameBytes{}}, {noise}, {noise, FrameBytes{}, noise}}) {
      const auto result = decode_picture(codec, frames);
      ASSERT_TRUE(std::holds_alternative<Problem>(result)) << codec;
      EXPECT_EQ(std::get<Problem>(result).code, ExitCode::kNoVideo);
    }
  }
  EXPECT_EQ(std::get<Problem>(decode_picture("H.265", {noise})).text,
            "the camera's H.265 picture cannot be decoded: there is no decoder for it");
}

#else

TEST(PictureDecoder, RefusesWithoutFfmpegAndSaysWhatToDo) {
  const auto result = decode_picture("H.264", {});
  ASSERT_TRUE(std::holds_alternative<Problem>(result));
  EXPECT_EQ(std::get<Problem>(result).code, ExitCode::kUsage);
  EXPECT_EQ(std::get<Problem>(result).text,
            "this vexactl was built without FFmpeg's libraries; decoding H.264 needs them");
  EXPECT_TRUE(std::holds_alternative<Problem>(encode_picture({}, PictureFormat::kPng)));
}

#endif

}  // namespace
}  // namespace vexa::host
