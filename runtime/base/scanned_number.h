// Decimal numbers at the front of a text, with scanf's leniency and without its overflow.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>

namespace vexa {

struct ScannedNumber {
  std::uint32_t value;  ///< larger and negative numbers become the largest value
  std::size_t length;   ///< characters read, spaces and sign among them
};

/// Reads spaces, a sign and digits; sign and digits are `width` characters at most. Nullopt when there is no digit.
std::optional<ScannedNumber> scan_number(std::string_view text, std::size_t width);

}  // namespace vexa
