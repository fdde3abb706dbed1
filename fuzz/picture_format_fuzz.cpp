// SPDX-License-Identifier: Apache-2.0
// The format of a frame of any bytes, for each codec. What follows the picture's parameters does not change it, and of
// JPEG a second search finds the same size.
#include <algorithm>
#include <vector>

#include "fuzz/check.h"
#include "media/assembly/picture_format.h"

namespace {

using vexa_fuzz::check;

constexpr std::size_t kFront = 1024;  // bytes of a frame that are searched

/// The first start of frame after SOI, segment by segment: whether there is a whole one of a size that is not zero.
bool has_frame_header(vexa::Bytes jpeg) {
  if (jpeg.size() < 2 || jpeg[0] != 0xff || jpeg[1] != 0xd8) return false;
  for (std::size_t at = 2; at + 9 <= std::min(jpeg.size(), kFront);) {
    const std::size_t length = static_cast<std::size_t>(jpeg[at + 2]) << 8 | jpeg[at + 3];
    if (jpeg[at] != 0xff || jpeg[at + 1] == 0xda || length < 2) return false;
    if (jpeg[at + 1] == 0xc0) {
      return length >= 7 && (jpeg[at + 5] | jpeg[at + 6] | jpeg[at + 7] | jpeg[at + 8]) != 0;
    }
    at += 2 + length;
  }
  return false;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  // A block of its own, so that a sanitizer sees reads outside.
  std::vector<unsigned char> frame(data, data + size);
  for (const auto codec : {vexa::CodecKind::kJpeg, vexa::CodecKind::kMpeg4, vexa::CodecKind::kH264}) {
    const std::uint64_t format = vexa::picture_format(codec, frame);
    check(vexa::picture_format(codec, {data, size}) == format);
  }
  if (has_frame_header(frame)) check(vexa::picture_format(vexa::CodecKind::kJpeg, frame) != 0);
  const std::uint64_t jpeg = vexa::picture_format(vexa::CodecKind::kJpeg, frame);
  frame.insert(frame.end(), {0x00, 0xff, 0xd9});
  if (jpeg != 0) check(vexa::picture_format(vexa::CodecKind::kJpeg, frame) == jpeg);
  return 0;
}
