#include "device/cgi/video_text.h"

#include <algorithm>

#include "runtime/base/text.h"

namespace vexa {
namespace {

constexpr VideoCodec kJpeg{"JPEG", 0};
constexpr VideoCodec kMpeg4{"MPEG4", 1};
constexpr VideoCodec kH264{"H.264", 2};

struct CodecWord {
  const char* word;
  const VideoCodec* codec;
};

// A camera with two encoders names the codec of the stream first.
constexpr CodecWord kCodecWords[] = {
    {"jpeg", &kJpeg}, {"jpeg-mpeg4", &kJpeg}, {"mpeg4", &kMpeg4}, {"mpeg4-jpeg", &kMpeg4}, {"h264", &kH264}};

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

PlacedValue value_behind(std::string_view answer, std::size_t key_at, std::size_t key_length) {
  // Safe: a key said to lie beyond the answer has an empty value and no bytes are read.
  if (key_at > answer.size() || key_length > answer.size() - key_at) return {{}, answer.size()};
  const std::size_t start = key_at + key_length;
  const std::string_view value = text_before(answer.substr(start), '&');
  return {value, start + value.size()};
}

std::string stream_key(const char* name, int stream) { return name + std::to_string(stream) + "="; }

const VideoCodec* video_codec_of(std::string_view word) {
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
  if (info.codecName == kMpeg4.name) return {"mpeg4", "BitRate", info.bitRate};
  if (info.codecName == kH264.name) return {"h264", "BitRate", info.bitRate};
  return {"jpeg", "Quality", info.quality};
}

}  // namespace vexa
