// SPDX-License-Identifier: Apache-2.0
#include "host/base/codec.h"

#include <gtest/gtest.h>

#include "vexa/video_info.h"

namespace vexa::host {
namespace {

TEST(CodecNames, GoBothWays) {
  for (const Codec codec : {Codec::kJpeg, Codec::kMpeg4, Codec::kH264}) EXPECT_EQ(codec_named(name_of(codec)), codec);
  EXPECT_STREQ(name_of(Codec::kJpeg), "JPEG");
  EXPECT_STREQ(name_of(Codec::kMpeg4), "MPEG4");
  EXPECT_STREQ(name_of(Codec::kH264), "H.264");
  for (const char* other : {"", "jpeg", "h264", "H.265", "JPEG "}) EXPECT_EQ(codec_named(other), std::nullopt) << other;
}

TEST(CodecNames, OfAListOfRecordingsAreItsOwn) {
  EXPECT_EQ(codec_listed_as("jpeg"), Codec::kJpeg);
  EXPECT_EQ(codec_listed_as("mpeg4"), Codec::kMpeg4);
  EXPECT_EQ(codec_listed_as("h264"), Codec::kH264);
  for (const char* other : {"", "JPEG", "H.264", "h265"}) EXPECT_EQ(codec_listed_as(other), std::nullopt) << other;
}

TEST(FrameTypes, SayCodecAndWhetherItIsAKeyFrame) {
  const struct {
    std::int32_t type;
    std::optional<Codec> codec;
    bool key;
  } cases[] = {{VIDEO_FRAME_JPEG, Codec::kJpeg, true},
               {VIDEO_FRAME_MPEG4_KEY, Codec::kMpeg4, true},
               {VIDEO_FRAME_MPEG4_DELTA, Codec::kMpeg4, false},
               {VIDEO_FRAME_H264_KEY, Codec::kH264, true},
               {VIDEO_FRAME_H264_DELTA, Codec::kH264, false},
               {VIDEO_FRAME_INVALID, std::nullopt, false},
               {1, std::nullopt, false}};
  for (const auto& row : cases) {
    EXPECT_EQ(codec_of_frame(row.type), row.codec) << row.type;
    EXPECT_EQ(is_key_frame(row.type), row.key) << row.type;
  }
}

}  // namespace
}  // namespace vexa::host
