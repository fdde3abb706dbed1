// SPDX-License-Identifier: Apache-2.0
// Numbers in texts.
#ifndef VIRTUAL_CAMERA_VALUES_NUMBER_TEXT_H_
#define VIRTUAL_CAMERA_VALUES_NUMBER_TEXT_H_

#include <charconv>
#include <optional>
#include <string_view>
#include <system_error>
#include <type_traits>

namespace vexa::camera {

// The number at the beginning of the text, whatever follows; nullopt without one, or where it does not fit. Only signed
// numbers take a minus; none takes a plus or a space before it.
template <typename Number = int>
[[nodiscard]] std::optional<Number> leading_number(std::string_view text) {
  Number number{};
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  return error == std::errc() ? std::optional<Number>(number) : std::nullopt;
}

// The same where the number is the whole text. The base is that of whole numbers.
template <typename Number = int>
[[nodiscard]] std::optional<Number> whole_number(std::string_view text, int base = 10) {
  Number number{};
  std::from_chars_result result{};
  if constexpr (std::is_floating_point_v<Number>) {
    result = std::from_chars(text.data(), text.data() + text.size(), number);
  } else {
    result = std::from_chars(text.data(), text.data() + text.size(), number, base);
  }
  const auto [end, error] = result;
  return error == std::errc() && end == text.data() + text.size() ? std::optional<Number>(number) : std::nullopt;
}

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_VALUES_NUMBER_TEXT_H_
