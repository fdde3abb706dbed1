// SPDX-License-Identifier: Apache-2.0
// Fragmented MP4 of one H.264 track, as browsers' media sources take it.
#ifndef HOST_SERVE_MP4_BOXES_H_
#define HOST_SERVE_MP4_BOXES_H_

#include <cstdint>
#include <string>
#include <string_view>

#include "host/serve/h264_units.h"

namespace vexa::host {

constexpr std::uint32_t kVideoClock = 90000;  // units of time a second

// ftyp and moov: a track without an end. The parameter sets have four bytes or more, and fewer than 65536.
[[nodiscard]] std::string init_segment(std::string_view sps, std::string_view pps, PictureSize size);

// One picture of the track.
struct Mp4Sample {
  std::uint32_t number = 1;  // of the fragment
  std::uint64_t time = 0;    // of decoding, which is that of showing, in units of kVideoClock
  std::uint32_t duration = 0;
  bool is_key = false;
};

// moof and mdat; `samples` as H264Picture has them.
[[nodiscard]] std::string media_fragment(const Mp4Sample& sample, std::string_view samples);

}  // namespace vexa::host

#endif  // HOST_SERVE_MP4_BOXES_H_
