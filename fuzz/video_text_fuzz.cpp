// SPDX-License-Identifier: Apache-2.0
// Readings of video settings: any answer is read without a fault, and every value lies inside it.
#include <cstdint>
#include <cstdlib>
#include <string>
#include <string_view>

#include "device/cgi/video_text.h"
#include "runtime/base/scanned_number.h"

namespace {

void check(bool holds) {
  if (!holds) std::abort();
}

void read_value(std::string_view answer, std::size_t at, std::size_t length) {
  const vexa::PlacedValue value = vexa::value_after(answer, at, length);
  check(value.end <= answer.size());
  check(value.text.find('&') == std::string_view::npos);
  check(value.text.empty() || value.text.data() + value.text.size() == answer.data() + value.end);
  const vexa::Codec* codec = vexa::video_codec_of(value.text);
  check(codec == nullptr || vexa::codec_named(codec->name) == codec);
  const ELibDVideoStandard standard = vexa::video_standard_of(value.text);
  check(standard == LIBD_VIDEO_PAL || standard == LIBD_VIDEO_NTSC);
  const vexa::StreamSize size = vexa::read_stream_size(value.text);
  check(!size.text || size.height != 0);
  vexa::leading_pair(std::string(value.text));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view answer(reinterpret_cast<const char*>(data), size);
  for (const char* name : {"ImageCodec", "ImageSize", "FrameRate", "Quality", "BitRate"}) {
    const std::string key = vexa::stream_key(name, 1);
    const std::size_t at = answer.find(key);
    if (at != std::string_view::npos) read_value(answer, at, key.size());
  }
  read_value(answer, 0, 0);
  read_value(answer, size / 2, size / 3);
  read_value(answer, size, 1);
  read_value(answer, std::string_view::npos, std::string_view::npos);
  return 0;
}
