// SPDX-License-Identifier: Apache-2.0
#include "runtime/base/scanned_number.h"

#include <algorithm>
#include <limits>
#include <string_view>

#include "runtime/base/text.h"

namespace vexa {
namespace {

constexpr std::uint32_t kTooLarge = std::numeric_limits<std::uint32_t>::max();

std::uint32_t with_digit(std::uint32_t value, char digit) {
  const std::uint64_t longer = std::uint64_t{value} * 10 + static_cast<std::uint64_t>(digit - '0');
  return static_cast<std::uint32_t>(std::min<std::uint64_t>(longer, kTooLarge));
}

}  // namespace

std::optional<ScannedNumber> scan_number(std::string_view text, std::size_t width) {
  const std::size_t spaces = std::min(text.find_first_not_of(" \t\n\v\f\r"), text.size());
  const std::string_view number = text.substr(spaces, width);
  const bool negative = !number.empty() && number.front() == '-';
  const std::size_t first_digit = negative || (!number.empty() && number.front() == '+') ? 1 : 0;
  const std::size_t end = std::min(number.find_first_not_of("0123456789", first_digit), number.size());
  if (end <= first_digit) return std::nullopt;
  std::uint32_t value = 0;
  for (const char digit : number.substr(first_digit, end - first_digit)) value = with_digit(value, digit);
  if (negative && value != 0) value = kTooLarge;
  return ScannedNumber{value, spaces + end};
}

std::optional<NumberPair> leading_pair(const std::string& text) {
  std::string_view rest = text;
  const std::optional<int> first = take_int(rest);
  if (!first || !rest.starts_with(',')) return std::nullopt;
  rest.remove_prefix(1);
  const std::optional<int> second = take_int(rest);
  if (!second) return std::nullopt;
  return NumberPair{*first, *second};
}

}  // namespace vexa
