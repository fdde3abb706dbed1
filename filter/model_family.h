// SPDX-License-Identifier: Apache-2.0
// What the cameras of one family offer: the tables that the criteria narrow.
#pragma once

#include <span>
#include <string_view>

namespace vexa::filter {

struct Size {
  int width;   ///< pixels
  int height;  ///< pixels
};

/// What a codec offers. JPEG has qualities and no bit rates, the others the reverse.
struct CodecTable {
  const char* name;                  ///< "JPEG", "MPEG4" or "H.264"
  std::span<const Size> sizes;       ///< from the largest to the smallest
  std::span<const int> frame_rates;  ///< frames per second, ascending
  std::span<const int> qualities;    ///< JPEG quality levels, ascending
  std::span<const int> bit_rates;    ///< kbit/s, ascending
};

struct ModelFamily {
  std::string_view prefix;  ///< what the names of its models begin with; empty: any model
  std::span<const CodecTable> codecs;
  Size largest_moving;  ///< the largest picture under solid PTZ, which is cut out of the captured one
};

/// The family of a model; the general one for a model that no family claims.
const ModelFamily& family_of(std::string_view model);

// Steps that all families share.
inline constexpr int kQualities[] = {1, 2, 3, 4, 5, 6, 7, 8, 9, 10};
inline constexpr int kRatesTo30[] = {1, 2, 3, 4, 5, 6, 8, 10, 12, 15, 20, 25, 30};
inline constexpr int kSdBitRates[] = {64, 128, 256, 384, 512, 768, 1024, 1536, 2048};
inline constexpr int kHdBitRates[] = {64,   128,  256,  384,  512,  768,  1024, 1536,
                                      2000, 2048, 3072, 4000, 4096, 6144, 8000, 8192};

}  // namespace vexa::filter
