// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/codec/image_clip.h"

#include <gtest/gtest.h>

namespace vexa::camera {
namespace {

std::string jpeg(const std::string& scan) {
  return std::string("\xff\xd8\xff\xdb\0\4\xff\xd9\xff\xda\0\3x", 13) + scan + "\xff\xd9";
}

TEST(ImageClip, CutsJpegPicturesAtTheEndOfTheirScans) {
  const std::string first =
      jpeg(std::string("a\xff\0b\xff\xd0"
                       "c",
                       7));
  const std::string second = jpeg("");
  EXPECT_EQ(cut_jpeg("front" + first + second + "behind" + first), (std::vector<std::string>{first, second, first}));
}

TEST(ImageClip, LeavesOutAJpegPictureThatIsCut) {
  const std::string whole = jpeg("scan");
  for (std::size_t length = 0; length < whole.size(); ++length) {
    EXPECT_EQ(cut_jpeg(whole + whole.substr(0, length)), std::vector<std::string>{whole}) << length;
  }
}

std::string unit(char code, const std::string& rest) { return std::string("\0\0\1", 3) + code + rest; }

TEST(ImageClip, CutsMpeg4PicturesAfterTheCodedPicture) {
  const std::string key = unit('\xb0', "sequence") + unit('\xb2', "user data") + unit('\xb6', "picture");
  const std::string delta = unit('\xb6', "next");
  EXPECT_EQ(cut_mpeg4("front" + key + delta + key), (std::vector<std::string>{key, delta, key}));
  EXPECT_TRUE(cut_mpeg4(unit('\xb0', "sequence")).empty());
  EXPECT_TRUE(cut_mpeg4("").empty());
}

TEST(ImageClip, PutsUserDataWhereItsKindHasIt) {
  const std::string text = "CamPos: 1";
  EXPECT_EQ(with_user_data(Codec::kJpeg, jpeg("x"), text), std::string("\xff\xd8\xff\xfe\0\x0b"
                                                                       "CamPos: 1",
                                                                       15) +
                                                               jpeg("x").substr(2));
  const std::string slice = std::string("\0\0\0\1", 4) + "eslice";
  EXPECT_EQ(with_user_data(Codec::kH264, slice, text),
            std::string("\0\0\0\1\6\5\x19", 7) + std::string(16, 'u') + text + "\x80" + slice);
  const std::string key = unit('\xb0', "sequence") + unit('\xb6', "picture");
  EXPECT_EQ(with_user_data(Codec::kMpeg4, key, text),
            unit('\xb0', "sequence") + unit('\xb2', text) + unit('\xb6', "picture"));
  for (const Codec kind : {Codec::kJpeg, Codec::kH264, Codec::kMpeg4}) {
    EXPECT_EQ(with_user_data(kind, key, ""), key);
  }
}

TEST(ImageClip, LoadsEveryKindByItsExtension) {
  const struct {
    const char* file;
    Codec kind;
    std::size_t pictures;
  } cases[] = {
      {"/small.mjpeg", Codec::kJpeg, 50}, {"/small.h264", Codec::kH264, 250}, {"/small.m4v", Codec::kMpeg4, 100}};
  for (const auto& c : cases) {
    const auto clip = ImageClip::load(std::string(VEXA_CLIPS) + c.file);
    ASSERT_NE(clip, nullptr) << c.file;
    EXPECT_EQ(clip->kind(), c.kind);
    EXPECT_EQ(clip->pictures().size(), c.pictures);
  }
  for (const char* file : {"/missing.mjpeg", "/tone.g711_64", ""}) {
    EXPECT_EQ(ImageClip::load(std::string(VEXA_CLIPS) + file), nullptr) << file;
  }
}

}  // namespace
}  // namespace vexa::camera
