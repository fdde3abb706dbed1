// SPDX-License-Identifier: Apache-2.0
#include "media/assembly/codec.h"

#include <gtest/gtest.h>

namespace vexa {
namespace {

TEST(Codec, IsFoundByTheHostsNameWhole) {
  EXPECT_EQ(codec_named("JPEG"), &kJpegCodec);
  EXPECT_EQ(codec_named("MPEG4"), &kMpeg4Codec);
  EXPECT_EQ(codec_named("H.264"), &kH264Codec);
  for (const char* name : {"", "jpeg", "H264", "MPEG-4", "JPEG ", "JPEGX"})
    EXPECT_EQ(codec_named(name), nullptr) << name;
}

TEST(Codec, OfJpegAloneStandsInPartsAndMayOutgrowTheUsualBuffer) {
  for (const Codec* codec : {&kJpegCodec, &kMpeg4Codec, &kH264Codec}) {
    const bool jpeg = codec == &kJpegCodec;
    EXPECT_EQ(codec->elementary == nullptr, jpeg);
    EXPECT_EQ(codec->large_frames, jpeg);
    EXPECT_EQ(codec->key_frame == codec->delta_frame, jpeg);
  }
}

}  // namespace
}  // namespace vexa
