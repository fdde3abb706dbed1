// SPDX-License-Identifier: Apache-2.0
// Decimal numbers at the front of a text, with scanf's leniency and without its overflow.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace vexa {

struct ScannedNumber {
  std::uint32_t value;  ///< larger and negative numbers become the largest value
  std::size_t length;   ///< characters read, spaces and sign among them
};

/// Reads spaces, a sign and digits; sign and digits are `width` characters at most. Nullopt when there is no digit.
std::optional<ScannedNumber> scan_number(std::string_view text, std::size_t width);

struct NumberPair {
  int first;
  int second;
};

/// The two numbers that a text begins with, as scanf reads "%d,%d": blanks and a sign may come before each, the comma
/// right after the first, what follows the second is ignored. Nullopt when either is missing. Values beyond int
/// become its limits.
std::optional<NumberPair> leading_pair(const std::string& text);

}  // namespace vexa
