#include "device/cgi/preset_text.h"

#include <optional>
#include <string>

#include "runtime/base/text.h"

namespace vexa {
namespace {

/// Takes the piece before the next comma; `rest` is then what follows it, nullopt after the last piece.
std::string_view take_piece(std::optional<std::string_view>& rest) {
  if (!rest) return {};
  const std::string_view piece = text_before(*rest, ',');
  rest = text_after(*rest, ",");
  return piece;
}

}  // namespace

std::vector<SLibDPresetInfo> unnamed_presets(int count) {
  std::vector<SLibDPresetInfo> presets;
  // Safe: a negative count becomes no size.
  if (count > 0) presets.resize(static_cast<std::size_t>(count));
  for (std::size_t i = 0; i < presets.size(); ++i) presets[i].index = static_cast<std::int32_t>(i);
  return presets;
}

bool name_presets(std::string_view list, std::vector<SLibDPresetInfo>& presets) {
  std::optional<std::string_view> rest = list;
  while (rest) {
    const std::string_view number = take_piece(rest);
    const std::string_view name = take_piece(rest);
    if (number.empty() || name.empty()) return false;
    const long long index = leading_int(std::string(number)) - 1LL;
    if (index < 0 || index >= static_cast<long long>(presets.size())) return false;
    SLibDPresetInfo& preset = presets[static_cast<std::size_t>(index)];
    preset.index = static_cast<std::int32_t>(index);
    preset.name = name;
  }
  return true;
}

}  // namespace vexa
