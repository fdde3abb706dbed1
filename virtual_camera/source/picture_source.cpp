// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/source/picture_source.h"

#include <cmath>
#include <span>

#include "virtual_camera/codec/clip.h"

namespace vexa::camera {
namespace {

constexpr std::uint8_t kSequenceParameters = 7;
constexpr std::uint8_t kPictureParameters = 8;

std::string first_unit_of(const AccessUnit& picture, std::uint8_t type) {
  for (const NalUnit& nal : picture.units) {
    if (nal.type != type) continue;
    const std::span<const std::uint8_t> unit = picture.unit(nal);
    return {unit.begin(), unit.end()};
  }
  return {};
}

}  // namespace

std::chrono::nanoseconds steady_time(std::uint64_t index, double frames_per_second) {
  return std::chrono::nanoseconds(std::llround(static_cast<double>(index) * 1e9 / frames_per_second));
}

SourceFormat source_format(Codec codec, std::string_view first_picture, double frames_per_second) {
  SourceFormat format;
  format.codec = codec;
  format.frames_per_second = frames_per_second;
  if (codec != Codec::kH264) return format;
  const Clip clip = Clip::from_annex_b(first_picture);
  if (clip.access_units().empty()) return format;
  format.sequence_parameters = first_unit_of(clip.access_units().front(), kSequenceParameters);
  format.picture_parameters = first_unit_of(clip.access_units().front(), kPictureParameters);
  return format;
}

}  // namespace vexa::camera
