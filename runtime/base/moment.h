// SPDX-License-Identifier: Apache-2.0
// Moments as counts of nanoseconds: 64 bits reach to the year 2262.
#pragma once

#include <chrono>
#include <cstdint>

namespace vexa {

inline constexpr std::int64_t kNanosecondsASecond = 1'000'000'000;

/// A moment's count on the steady clock.
inline std::int64_t nanoseconds_of(std::chrono::steady_clock::time_point moment) {
  return std::chrono::duration_cast<std::chrono::nanoseconds>(moment.time_since_epoch()).count();
}

/// This moment's count on the real-time clock.
inline std::int64_t nanoseconds_since_1970() {
  const auto now = std::chrono::system_clock::now().time_since_epoch();
  return std::chrono::duration_cast<std::chrono::nanoseconds>(now).count();
}

}  // namespace vexa
