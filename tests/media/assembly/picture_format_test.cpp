#include "media/assembly/picture_format.h"

#include <gtest/gtest.h>

#include <vector>

namespace vexa {
namespace {

using Frame = std::vector<unsigned char>;

TEST(PictureFormat, OfH264ChangesWithTheSequenceParameterSetAlone) {
  const Frame frame = {0, 0, 0, 1, 0x67, 1, 2, 0, 0, 0, 1, 0x68, 3, 0, 0, 0, 1, 0x65, 4};
  Frame other_picture = frame;
  other_picture.back() = 5;
  Frame other_set = frame;
  other_set[6] = 9;
  const std::uint64_t format = picture_format(CodecKind::kH264, frame);
  EXPECT_NE(format, 0u);
  EXPECT_EQ(picture_format(CodecKind::kH264, other_picture), format);
  EXPECT_NE(picture_format(CodecKind::kH264, other_set), format);
  EXPECT_EQ(picture_format(CodecKind::kH264, Frame{0, 0, 0, 1, 0x65, 4}), 0u);
}

TEST(PictureFormat, OfMpeg4ChangesWithTheVideoObjectLayerAlone) {
  const Frame frame = {0, 0, 1, 0xb0, 1, 0, 0, 1, 0x20, 7, 8, 0, 0, 1, 0xb6, 4};
  Frame other_layer = frame;
  other_layer[10] = 9;
  Frame other_profile = frame;
  other_profile[4] = 2;
  const std::uint64_t format = picture_format(CodecKind::kMpeg4, frame);
  EXPECT_NE(format, 0u);
  EXPECT_EQ(picture_format(CodecKind::kMpeg4, other_profile), format);
  EXPECT_NE(picture_format(CodecKind::kMpeg4, other_layer), format);
}

TEST(PictureFormat, OfJpegIsWidthAndHeight) {
  const Frame frame = {0xff, 0xd8, 0xff, 0xe0, 0, 4, 9, 9, 0xff, 0xc0, 0, 17, 8, 0x01, 0xe0, 0x02, 0x80};
  EXPECT_EQ(picture_format(CodecKind::kJpeg, frame), 0x0280u << 16 | 0x01e0u);
  EXPECT_EQ(picture_format(CodecKind::kJpeg, Frame{0xff, 0xd8, 0xff, 0xda, 0, 2}), 0u);
}

TEST(PictureFormat, FramesCutAnywhereOrOfAnyBytesAreBorne) {
  const Frame frames[] = {{0xff, 0xd8, 0xff, 0xe0, 0, 4, 9, 9, 0xff, 0xc0, 0, 17, 8, 0x01, 0xe0, 0x02, 0x80},
                          {0, 0, 0, 1, 0x67, 1, 0, 0, 1},
                          {0, 0, 1},
                          Frame(3000, 0),
                          Frame(3000, 0xff)};
  for (const Frame& frame : frames) {
    for (std::size_t length = 0; length <= frame.size(); ++length) {
      const Frame cut(frame.begin(), frame.begin() + static_cast<std::ptrdiff_t>(length));
      for (const CodecKind codec : {CodecKind::kJpeg, CodecKind::kMpeg4, CodecKind::kH264}) {
        (void)picture_format(codec, cut);
      }
    }
  }
}

}  // namespace
}  // namespace vexa
