// SPDX-License-Identifier: Apache-2.0
// Numbers as a person or a camera writes them.
#ifndef HOST_BASE_NUMBER_TEXT_H_
#define HOST_BASE_NUMBER_TEXT_H_

#include <charconv>
#include <optional>
#include <string_view>
#include <system_error>

namespace vexa::host {

// Takes the number that `text` begins with off its front; nullopt, and `text` as it was, where it begins with none or
// with one that the type cannot hold. A number has no plus sign and no blank in front.
template <typename Number>
[[nodiscard]] std::optional<Number> take_number(std::string_view& text) {
  Number number{};
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  if (error != std::errc()) return std::nullopt;
  text.remove_prefix(static_cast<std::size_t>(end - text.data()));
  return number;
}

// The whole text as a number.
template <typename Number = int>
[[nodiscard]] std::optional<Number> number_text(std::string_view text) {
  const std::optional<Number> number = take_number<Number>(text);
  return text.empty() ? number : std::nullopt;
}

// The whole text as a whole number from `least` to `most`.
[[nodiscard]] inline std::optional<int> number_text(std::string_view text, int least, int most) {
  const std::optional<int> number = number_text(text);
  return number && *number >= least && *number <= most ? number : std::nullopt;
}

}  // namespace vexa::host

#endif  // HOST_BASE_NUMBER_TEXT_H_
