// SPDX-License-Identifier: Apache-2.0
// Lists of preset names: any bytes name presets that exist and leave their number and order alone.
#include <cstdint>
#include <cstdlib>
#include <string_view>

#include "device/cgi/ptz_text.h"

namespace {

void check(bool holds) {
  if (!holds) std::abort();
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  const int count = static_cast<std::int8_t>(data[0]);
  const std::string_view list(reinterpret_cast<const char*>(data) + 1, size - 1);
  std::vector<SLibDPresetInfo> presets = vexa::unnamed_presets(count);
  check(presets.size() == static_cast<std::size_t>(count < 0 ? 0 : count));
  const bool whole = vexa::name_presets(list, presets);
  check(!whole || (!presets.empty() && list.find(',') != std::string_view::npos));
  for (std::size_t i = 0; i < presets.size(); ++i) {
    check(presets[i].index == static_cast<int>(i));
    check(presets[i].name.find(',') == std::string::npos && presets[i].name.size() < size);
  }
  return 0;
}
