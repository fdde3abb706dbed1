// SPDX-License-Identifier: Apache-2.0
// Any user data: a position is 8 to 24 characters of it that begin with its key.
#include <cstdint>
#include <cstdlib>
#include <string_view>

#include "media/assembly/elementary_unit.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  constexpr std::string_view kKey = "CamPos: ";
  const vexa::Bytes user_data(data, size);
  for (const vexa::Bytes searched : {user_data, vexa::front_of_user_data(user_data)}) {
    const auto position = vexa::camera_position(searched);
    if (!position) continue;
    if (position->size() < kKey.size() || position->size() > 24 || !position->starts_with(kKey)) std::abort();
  }
  return 0;
}
