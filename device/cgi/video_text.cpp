// SPDX-License-Identifier: Apache-2.0
#include "device/cgi/video_text.h"

#include <algorithm>

#include "media/assembly/codec.h"
#include "runtime/base/text.h"

namespace vexa {
namespace {

struct CodecWord {
  const char* word;
  const Codec* codec;
};

// A camera with two encoders names the codec of the stream first.
constexpr CodecWord kCodecWords[] = {{"jpeg", &kJpegCodec},
                                     {"jpeg-mpeg4", &kJpegCodec},
                                     {"mpeg4", &kMpeg4Codec},
                                     {"mpeg4-jpeg", &kMpeg4Codec},
                                     {"h264", &kH264Codec}};

struct ClassicSize {
  int width;
  int height;
  const char* text;
};

constexpr ClassicSize kClassicSizes[] = {
    {160, 120, "160x120"}, {320, 240, "320x240"}, {384, 288, "384x288"}, {640, 480, "640x480"}};

StreamSize classic_size(int width) {
  for (const ClassicSize& size : kClassicSizes) {
    if (size.width == width) return {width, size.height, size.text};
  }
  return {width, 0, std::nullopt};
}

}  // namespace

PlacedValue value_after(std::string_view answer, std::size_t key_at, std::size_t key_length) {
  // Safe: a place beyond the answer gives an empty value, and no bytes are read.
  if (key_at > answer.size() || key_length > answer.size() - key_at) return {{}, answer.size()};
  const std::size_t start = key_at + key_length;
  const std::string_view value = text_before(answer.substr(start), '&');
  return {value, start + value.size()};
}

std::string stream_key(const char* name, int stream) { return name + std::to_string(stream) + "="; }

const Codec* video_codec_of(std::string_view word) {
  for (const CodecWord& row : kCodecWords) {
    if (row.word == word) return row.codec;
  }
  return nullptr;
}

ELibDVideoStandard video_standard_of(std::string_view value) {
  if (value.find("pal") != std::string_view::npos) return LIBD_VIDEO_PAL;
  if (value.find("ntsc") != std::string_view::npos) return LIBD_VIDEO_NTSC;
  return LIBD_VIDEO_PAL;
}

StreamSize read_stream_size(std::string_view value) {
  const std::size_t comma = value.find(',');
  if (comma == std::string_view::npos) return classic_size(0);
  const std::string width(value.substr(0, comma));
  const std::string height(value.substr(comma + 1));
  if (leading_int(height) == 0) return classic_size(leading_int(width));
  return {leading_int(width), leading_int(height), width + "x" + height};
}

CodecRequest codec_request(const SLibDCameraInfo& info) {
  const Codec* named = codec_named(info.codecName);
  const Codec& codec = named == nullptr ? kJpegCodec : *named;
  return {codec.word, codec.rate_key, codec.kind == CodecKind::kJpeg ? info.quality : info.bitRate};
}

}  // namespace vexa
