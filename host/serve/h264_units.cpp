// SPDX-License-Identifier: Apache-2.0
#include "host/serve/h264_units.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>

namespace vexa::host {
namespace {

constexpr std::uint32_t kLongestSide = 16384;
constexpr std::string_view kStartCode("\0\0\1", 3);

enum UnitType : unsigned { kIdr = 5, kSps = 7, kPps = 8, kDelimiter = 9, kFiller = 12 };

unsigned octet(char c) { return static_cast<unsigned char>(c); }
unsigned type_of(std::string_view unit) { return octet(unit.front()) & 0x1FU; }

// The bits of a parameter set, its emulation prevention bytes left out. Sticky: past the end everything reads as 0.
class Bits {
 public:
  explicit Bits(std::string_view unit) {
    for (std::size_t i = 0; i < unit.size(); ++i) {
      const bool prevention = i >= 2 && unit[i] == 3 && unit[i - 1] == 0 && unit[i - 2] == 0;
      if (!prevention) bytes_ += unit[i];
    }
  }

  [[nodiscard]] bool ok() const { return ok_; }
  std::uint32_t bit() {
    if (at_ >= bytes_.size() * 8) ok_ = false;
    if (!ok_) return 0;
    const std::uint32_t value = (octet(bytes_[at_ / 8]) >> (7 - at_ % 8)) & 1U;
    ++at_;
    return value;
  }
  std::uint32_t bits(unsigned count) {
    std::uint32_t value = 0;
    while (count-- > 0) value = (value << 1U) | bit();
    return value;
  }
  // Exponential Golomb.
  std::uint32_t ue() {
    unsigned zeros = 0;
    while (ok_ && bit() == 0) ++zeros;
    if (zeros > 31) ok_ = false;
    return ok_ ? (1U << zeros) - 1 + bits(zeros) : 0;
  }
  std::int32_t se() {
    const std::uint32_t value = ue();
    const auto half = static_cast<std::int32_t>(value / 2 + value % 2);
    return value % 2 == 1 ? half : -half;
  }

 private:
  std::string bytes_;
  std::size_t at_ = 0;
  bool ok_ = true;
};

bool has_chroma_format(std::uint32_t profile) {
  constexpr std::array<std::uint32_t, 13> kHighProfiles = {100, 110, 122, 244, 44,  83, 86,
                                                           118, 128, 138, 139, 134, 135};
  return std::find(kHighProfiles.begin(), kHighProfiles.end(), profile) != kHighProfiles.end();
}

void pass_scaling_list(Bits& in, int size) {
  std::uint32_t last = 8;
  std::uint32_t next = 8;
  for (int i = 0; i < size && in.ok(); ++i) {
    if (next != 0) next = (last + static_cast<std::uint32_t>(in.se())) & 0xFFU;
    if (next != 0) last = next;
  }
}

// The chroma_format_idc; 1 where the profile states none.
std::uint32_t pass_chroma(Bits& in, std::uint32_t profile) {
  if (!has_chroma_format(profile)) return 1;
  const std::uint32_t format = in.ue();
  if (format == 3) in.bit();  // separate planes
  in.ue();                    // depths of luma and chroma
  in.ue();
  in.bit();  // bypass of the transform
  if (in.bit() == 0) return format;
  const int lists = format == 3 ? 12 : 8;
  for (int i = 0; i < lists && in.ok(); ++i) {
    if (in.bit() != 0) pass_scaling_list(in, i < 6 ? 16 : 64);
  }
  return format;
}

void pass_picture_order(Bits& in) {
  const std::uint32_t type = in.ue();
  if (type == 0) in.ue();
  if (type != 1) return;
  in.bit();
  in.se();
  in.se();
  for (std::uint32_t count = in.ue(); count > 0 && in.ok(); --count) in.se();
}

void add_unit(H264Picture& picture, std::string_view unit) {
  // Zeros that follow a unit belong to the next start code.
  while (!unit.empty() && unit.back() == 0) unit.remove_suffix(1);
  if (unit.empty()) return;
  const unsigned type = type_of(unit);
  if (type == kSps) picture.sps = unit;
  if (type == kPps) picture.pps = unit;
  if (type == kSps || type == kPps || type == kDelimiter || type == kFiller) return;
  picture.is_idr = picture.is_idr || type == kIdr;
  for (const unsigned shift : {24U, 16U, 8U, 0U}) {
    picture.samples += static_cast<char>((unit.size() >> shift) & 0xFFU);
  }
  picture.samples += unit;
}

}  // namespace

H264Picture take_apart(std::string_view picture) {
  H264Picture apart;
  std::size_t start = picture.find(kStartCode);
  while (start != std::string_view::npos) {
    start += kStartCode.size();
    const std::size_t end = picture.find(kStartCode, start);
    add_unit(apart, picture.substr(start, end == std::string_view::npos ? end : end - start));
    start = end;
  }
  return apart;
}

std::optional<PictureSize> size_of(std::string_view sps) {
  if (sps.size() < 4) return std::nullopt;
  Bits in(sps.substr(1));
  const std::uint32_t profile = in.bits(8);
  in.bits(16);  // constraints, level
  in.ue();      // number of the set
  const std::uint32_t chroma = pass_chroma(in, profile);
  in.ue();  // bits of a frame's number
  pass_picture_order(in);
  in.ue();   // reference pictures
  in.bit();  // gaps
  const std::uint64_t columns = in.ue() + std::uint64_t{1};
  const std::uint64_t rows = in.ue() + std::uint64_t{1};
  const std::uint32_t frames_only = in.bit();
  if (frames_only == 0) in.bit();
  in.bit();  // direct inference
  std::uint64_t width = columns * 16;
  std::uint64_t height = rows * 16 * (2 - frames_only);
  if (in.bit() != 0) {
    const std::uint64_t unit_x = chroma == 1 || chroma == 2 ? 2 : 1;
    const std::uint64_t unit_y = std::uint64_t{chroma == 1 ? 2U : 1U} * (2 - frames_only);
    const std::uint64_t sides = std::uint64_t{in.ue()} + in.ue();
    const std::uint64_t ends = std::uint64_t{in.ue()} + in.ue();
    width = width > sides * unit_x ? width - sides * unit_x : 0;
    height = height > ends * unit_y ? height - ends * unit_y : 0;
  }
  const bool usable = in.ok() && width > 0 && height > 0 && width <= kLongestSide && height <= kLongestSide;
  if (!usable) return std::nullopt;
  return PictureSize{static_cast<unsigned>(width), static_cast<unsigned>(height)};
}

std::string codec_string(std::string_view sps) {
  if (sps.size() < 4) return {};
  return fmt::format("avc1.{:02X}{:02X}{:02X}", octet(sps[1]), octet(sps[2]), octet(sps[3]));
}

}  // namespace vexa::host
