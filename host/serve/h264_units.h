// SPDX-License-Identifier: Apache-2.0
// A picture of H.264 as a camera sends it, with start codes, taken apart for a container.
#ifndef HOST_SERVE_H264_UNITS_H_
#define HOST_SERVE_H264_UNITS_H_

#include <optional>
#include <string>
#include <string_view>

namespace vexa::host {

// One picture. A later parameter set of its kind replaces an earlier one.
struct H264Picture {
  std::string sps;      // sequence parameter set, without start code; empty: none
  std::string pps;      // picture parameter set
  std::string samples;  // the other units, each after four bytes of its length; delimiters and filler left out
  bool is_idr = false;
};

// Bytes before the first start code are left out; empty units too.
[[nodiscard]] H264Picture take_apart(std::string_view picture);

struct PictureSize {
  unsigned width = 0;
  unsigned height = 0;
};

// What a sequence parameter set states, cropping taken off; nullopt for one that is cut off, or of no picture from 1x1
// to 16384x16384.
[[nodiscard]] std::optional<PictureSize> size_of(std::string_view sps);

// "avc1.4D401F": profile, constraints and level of the parameter set; empty for one of fewer than four bytes.
[[nodiscard]] std::string codec_string(std::string_view sps);

}  // namespace vexa::host

#endif  // HOST_SERVE_H264_UNITS_H_
