// SPDX-License-Identifier: Apache-2.0
// The camera's texts of video settings: codec words, sizes, keys of one stream.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

#include "media/assembly/codec.h"
#include "vexa/video_info.h"

namespace vexa {

/// A value inside an answer and the place where it ends.
struct PlacedValue {
  std::string_view text;
  std::size_t end;
};

/// The value of the key that begins at `key_at` and is `key_length` long, up to the next "&" or the end. Empty when the
/// key is not within the answer.
PlacedValue value_after(std::string_view answer, std::size_t key_at, std::size_t key_length);

/// The key of one stream's setting: ("ImageCodec", 1) is "ImageCodec1=".
std::string stream_key(const char* name, int stream);

/// The codec a stream sends in a camera's mode `word`; null for an unknown word.
const Codec* video_codec_of(std::string_view word);

/// The video standard that the value names; PAL when it names none.
ELibDVideoStandard video_standard_of(std::string_view value);

/// The size of a stream's pictures as the camera gives it.
struct StreamSize {
  int width;
  int height;
  std::optional<std::string> text;  ///< nullopt for a size that has no name
};

/// Reads "width,height". A height of 0 means the usual height of that width.
StreamSize read_stream_size(std::string_view value);

/// How a request names a codec and what limits its data rate.
struct CodecRequest {
  const char* word;     ///< the camera's word of the codec
  const char* rateKey;  ///< "BitRate" or "Quality"
  int rate;             ///< kbit/s or JPEG quality level
};

/// The request's part for the codec named in `info`; any name that is not known asks for JPEG.
CodecRequest codec_request(const SLibDCameraInfo& info);

}  // namespace vexa
