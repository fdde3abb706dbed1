// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/codec/live_encoder.h"

#include <gtest/gtest.h>

namespace vexa::camera {
namespace {

std::string refusal_of(const LiveEncoding& encoding) {
  const auto opened = LiveEncoder::open(encoding);
  const auto* text = std::get_if<std::string>(&opened);
  return text != nullptr ? *text : "";
}

TEST(LiveEncoder, OpensWhereTheBuildHasEncodersAndElseReportsWhyNot) {
  for (const Codec codec : {Codec::kJpeg, Codec::kMpeg4, Codec::kH264}) {
    EXPECT_EQ(refusal_of({codec, 320, 192}), has_live_encoders() ? "" : "this build is without FFmpeg's libraries");
  }
}

TEST(LiveEncoder, RefusesWhatNoPictureCanBe) {
  if (!has_live_encoders()) GTEST_SKIP() << "built without FFmpeg's libraries";
  for (const Codec codec : {Codec::kJpeg, Codec::kMpeg4, Codec::kH264}) {
    for (const auto& [width, height] : {std::pair(0, 192), {320, 0}, {-2, 192}, {319, 192}, {320, 191}}) {
      EXPECT_EQ(refusal_of({codec, width, height}), "sides of a picture are even and at least 2");
    }
    EXPECT_EQ(refusal_of({codec, 320, 192, 0}), "at least one picture a second");
    EXPECT_NE(refusal_of({codec, 200000, 200000}), "");
  }
}

}  // namespace
}  // namespace vexa::camera
