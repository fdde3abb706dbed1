// SPDX-License-Identifier: Apache-2.0
// Alarm parts, for all forms in which cameras report motion; the first byte chooses.
#include <cstddef>
#include <cstdint>
#include <cstdlib>

#include "device/cgi/input_part.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  const std::string_view part(reinterpret_cast<const char*>(data) + 1, size - 1);
  const vexa::PinMasks bits = vexa::parse_input_part(part, {(data[0] & 1) != 0, (data[0] & 2) != 0});
  const std::uint32_t lowest = bits.present & (~bits.present + 1);
  // A state begins at the bit of an item that is present.
  if (bits.state != 0 && (lowest == 0 || bits.state < lowest)) std::abort();
  return 0;
}
