// Decimal numbers at the front of a text, with scanf's leniency and without its overflow.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace vexa {

struct ScannedNumber {
  std::uint32_t value;  ///< the largest value stands for any larger one and for every negative one
  std::size_t length;   ///< characters read, spaces and sign among them
};

/// Reads spaces, a sign and digits; sign and digits are `width` characters at most. Nothing when there is no digit.
std::optional<ScannedNumber> scan_number(std::string_view text, std::size_t width);

struct NumberPair {
  int first;
  int second;
};

/// The two numbers that a text begins with, as scanf reads "%d,%d": blanks and a sign may stand before each, the comma
/// right behind the first, what follows the second is passed over. Nothing when either is missing. Values beyond int
/// become its limits.
std::optional<NumberPair> leading_pair(const std::string& text);

}  // namespace vexa
