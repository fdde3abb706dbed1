// SPDX-License-Identifier: Apache-2.0
// The codecs of pictures, and the camera's words for them in its settings.
#ifndef VIRTUAL_CAMERA_VALUES_CODEC_H_
#define VIRTUAL_CAMERA_VALUES_CODEC_H_

#include <algorithm>
#include <iterator>
#include <optional>
#include <string_view>

namespace vexa::camera {

enum class Codec { kJpeg, kMpeg4, kH264 };

struct CodecWord {
  Codec codec;
  std::string_view word;
};

inline constexpr CodecWord kCodecWords[] = {{Codec::kJpeg, "jpeg"}, {Codec::kMpeg4, "mpeg4"}, {Codec::kH264, "h264"}};

[[nodiscard]] inline std::string_view codec_word(Codec codec) {
  const auto is_of_it = [codec](const CodecWord& row) { return row.codec == codec; };
  return std::find_if(std::begin(kCodecWords), std::end(kCodecWords), is_of_it)->word;
}

// nullopt for any other word, such as "off".
[[nodiscard]] inline std::optional<Codec> codec_of(std::string_view word) {
  for (const CodecWord& row : kCodecWords) {
    if (row.word == word) return row.codec;
  }
  return std::nullopt;
}

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_VALUES_CODEC_H_
