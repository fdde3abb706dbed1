// SPDX-License-Identifier: Apache-2.0
// What the driver has to know about each video codec: one row a codec.
#pragma once

#include <cstdint>
#include <string_view>

#include "media/assembly/elementary_unit.h"
#include "media/assembly/picture_rules.h"
#include "vexa/video_info.h"

namespace vexa {

/// The values are those of SLibDCameraInfo::codecType.
enum class CodecKind : std::int32_t { kJpeg = 0, kMpeg4 = 1, kH264 = 2 };

struct Codec {
  CodecKind kind;
  const char* name;                   ///< as hosts know it: "JPEG", "MPEG4", "H.264"
  const char* word;                   ///< how a request names it
  const char* rate_key;               ///< what limits its data rate: "Quality" or "BitRate"
  const PictureRules& rules;          ///< of its pictures in RTP
  const ElementaryCodec* elementary;  ///< of its HTTP stream; null where each part of the stream is a picture
  ELibDVideoFrameType key_frame;
  ELibDVideoFrameType delta_frame;  ///< the key frame's where every picture stands alone
  bool large_frames;                ///< its frames may outgrow the usual buffer
};

extern const Codec kJpegCodec;
extern const Codec kMpeg4Codec;
extern const Codec kH264Codec;

/// The codec that hosts call `name`; null for any other text.
const Codec* codec_named(std::string_view name);

}  // namespace vexa
