// The wall clock at which a described stream begins: 20240131T235959.250Z.
#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

namespace vexa {

struct RangeClock {
  bool understood = false;              ///< the clock was read to its end
  std::optional<std::int64_t> seconds;  ///< since 1970-01-01 UTC, once a "." was reached, also when not understood
  int micros = 0;                       ///< with `understood`
};

/// Reads date "T" time "." fraction, up to a "Z" or the end of the line; the text ends at a NUL.
RangeClock parse_range_clock(std::string_view text);

}  // namespace vexa
