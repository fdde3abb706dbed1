#include "host/recording/codec_headers.h"

#include <algorithm>
#include <cstddef>

namespace vexa::host {
namespace {

using HeaderBytes = std::vector<std::uint8_t>;

constexpr std::uint8_t kStartCode[] = {0, 0, 1};

// Where the next start code begins; the end when there is none.
HeaderBytes::const_iterator find_coded_unit(HeaderBytes::const_iterator from, HeaderBytes::const_iterator end) {
  return std::search(from, end, std::begin(kStartCode), std::end(kStartCode));
}

HeaderBytes parameter_sets(const HeaderBytes& picture) {
  constexpr int kTypeBits = 0x1F;
  constexpr int kSequenceSet = 7;
  constexpr int kPictureSet = 8;
  HeaderBytes sets;
  for (auto unit = find_coded_unit(picture.begin(), picture.end()); picture.end() - unit > 3;) {
    const auto next = find_coded_unit(unit + 3, picture.end());
    const int type = unit[3] & kTypeBits;
    if (type == kSequenceSet || type == kPictureSet) {
      auto end = next;
      while (end[-1] == 0) --end;  // the next start code's first zero
      sets.push_back(0);
      sets.insert(sets.end(), unit, end);
    }
    unit = next;
  }
  return sets;
}

HeaderBytes headers_before_plane(const HeaderBytes& picture) {
  constexpr std::uint8_t kGroup = 0xB3;
  constexpr std::uint8_t kPlane = 0xB6;
  for (auto unit = find_coded_unit(picture.begin(), picture.end()); picture.end() - unit > 3;
       unit = find_coded_unit(unit + 3, picture.end())) {
    if (unit[3] == kGroup || unit[3] == kPlane) return {picture.begin(), unit};
  }
  return {};
}

}  // namespace

std::vector<std::uint8_t> codec_headers(const std::string& codec, const std::vector<std::uint8_t>& key_picture) {
  if (codec == "H.264") return parameter_sets(key_picture);
  if (codec == "MPEG4") return headers_before_plane(key_picture);
  return {};
}

}  // namespace vexa::host
