// SPDX-License-Identifier: Apache-2.0
#include "media/assembly/codec.h"

#include "media/assembly/rtp_pictures.h"

namespace vexa {

const Codec kJpegCodec = {CodecKind::kJpeg, "JPEG",           "jpeg",           "Quality", kJpegRules,
                          nullptr,          VIDEO_FRAME_JPEG, VIDEO_FRAME_JPEG, true};

const Codec kMpeg4Codec = {
    CodecKind::kMpeg4,       "MPEG4", "mpeg4", "BitRate", kMpeg4Rules, &kMpeg4Elementary, VIDEO_FRAME_MPEG4_KEY,
    VIDEO_FRAME_MPEG4_DELTA, false};

const Codec kH264Codec = {
    CodecKind::kH264,       "H.264", "h264", "BitRate", kH264Rules, &kH264Elementary, VIDEO_FRAME_H264_KEY,
    VIDEO_FRAME_H264_DELTA, false};

namespace {

constexpr const Codec* kCodecs[] = {&kJpegCodec, &kMpeg4Codec, &kH264Codec};

}  // namespace

const Codec* codec_named(std::string_view name) {
  for (const Codec* codec : kCodecs) {
    if (codec->name == name) return codec;
  }
  return nullptr;
}

}  // namespace vexa
