// SPDX-License-Identifier: Apache-2.0
// Position texts of pictures: any bytes give a position or none, and any position gives angles within their record.
#include <cstdint>
#include <cstdlib>
#include <string>

#include "device/cgi/position_text.h"

namespace {

void check(bool holds) {
  if (!holds) std::abort();
}

int taken_int(const std::uint8_t*& data, const std::uint8_t* end) {
  std::uint32_t value = 0;
  for (int i = 0; i < 4 && data != end; ++i) value = value << 8 | *data++;
  return static_cast<int>(value);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string text(reinterpret_cast<const char*>(data), size);
  const auto position = vexa::read_position_text(text);
  check(!position || (text.size() >= 23 && text.compare(0, 8, "CamPos: ") == 0));
  check(!position || !position->moving || text[23] == 'M');
  const std::uint8_t* const end = data + size;
  SLibDFixedPanTiltInfo camera;
  camera.horizontalWideAngle = taken_int(data, end);
  camera.verticalWideAngle = taken_int(data, end);
  const int span = taken_int(data, end);
  const int range = taken_int(data, end);
  const std::int64_t offset = -static_cast<std::int64_t>(taken_int(data, end));
  const int place = position ? position->pan : static_cast<std::int16_t>(span);
  check(span != 0 || vexa::axis_angle(place, span, range, offset) == place);
  vexa::axis_angle(place, span, range, offset);
  const int zoom = taken_int(data, end);
  std::vector<SLibDZoomRatioInt> ratios;
  while (data != end) {
    SLibDZoomRatioInt entry;
    entry.ratio = taken_int(data, end);
    entry.position = taken_int(data, end);
    ratios.push_back(entry);
  }
  const auto angles = vexa::viewing_angles(ratios, camera, zoom);
  check(!angles || (!ratios.empty() && camera.horizontalWideAngle != 0));
  return 0;
}
