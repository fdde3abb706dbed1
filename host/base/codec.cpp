// SPDX-License-Identifier: Apache-2.0
#include "host/base/codec.h"

#include <algorithm>
#include <array>

#include "vexa/video_info.h"

namespace vexa::host {
namespace {

struct CodecRow {
  Codec codec;
  const char* name;
  const char* listed;
  std::int32_t key_frame;
  std::int32_t other_frame;
};

constexpr std::array<CodecRow, 3> kRows{
    {{Codec::kJpeg, "JPEG", "jpeg", VIDEO_FRAME_JPEG, VIDEO_FRAME_JPEG},
     {Codec::kMpeg4, "MPEG4", "mpeg4", VIDEO_FRAME_MPEG4_KEY, VIDEO_FRAME_MPEG4_DELTA},
     {Codec::kH264, "H.264", "h264", VIDEO_FRAME_H264_KEY, VIDEO_FRAME_H264_DELTA}}};

template <typename Condition>
std::optional<Codec> codec_where(const Condition& holds) {
  const auto* row = std::find_if(kRows.begin(), kRows.end(), holds);
  return row == kRows.end() ? std::nullopt : std::optional(row->codec);
}

}  // namespace

const char* name_of(Codec codec) {
  return std::find_if(kRows.begin(), kRows.end(), [codec](const CodecRow& row) { return row.codec == codec; })->name;
}

std::optional<Codec> codec_named(std::string_view name) {
  return codec_where([name](const CodecRow& row) { return row.name == name; });
}

std::optional<Codec> codec_listed_as(std::string_view word) {
  return codec_where([word](const CodecRow& row) { return row.listed == word; });
}

std::optional<Codec> codec_of_frame(std::int32_t frame_type) {
  return codec_where(
      [frame_type](const CodecRow& row) { return row.key_frame == frame_type || row.other_frame == frame_type; });
}

bool is_key_frame(std::int32_t frame_type) {
  return std::any_of(kRows.begin(), kRows.end(),
                     [frame_type](const CodecRow& row) { return row.key_frame == frame_type; });
}

}  // namespace vexa::host
