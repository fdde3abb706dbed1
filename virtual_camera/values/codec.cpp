#include "virtual_camera/values/codec.h"

#include <algorithm>
#include <iterator>

namespace vexa::camera {
namespace {

struct Row {
  Codec codec;
  std::string_view word;
};

constexpr Row kRows[] = {{Codec::kJpeg, "jpeg"}, {Codec::kMpeg4, "mpeg4"}, {Codec::kH264, "h264"}};

}  // namespace

std::string_view codec_word(Codec codec) {
  return std::find_if(std::begin(kRows), std::end(kRows), [codec](const Row& row) { return row.codec == codec; })->word;
}

std::optional<Codec> codec_of(std::string_view word) {
  for (const Row& row : kRows) {
    if (row.word == word) return row.codec;
  }
  return std::nullopt;
}

}  // namespace vexa::camera
