// SPDX-License-Identifier: Apache-2.0
// Tick arithmetic under the time conversions and the time classes.
#pragma once

#include <cstdint>
#include <optional>

#include "vexa/real_time.h"

namespace vexa {

constexpr std::uint64_t kTicksPerMicrosecond = 10;
constexpr std::uint64_t kTicksPerMillisecond = 10000;
constexpr std::uint64_t kTicksPerSecond = 10000000;
constexpr std::uint64_t kTicksPerMinute = 60 * kTicksPerSecond;
constexpr std::uint64_t kTicksPerHour = 60 * kTicksPerMinute;
constexpr std::uint64_t kTicksPerDay = 24 * kTicksPerHour;

/// Seconds from 1601-01-01 to 1970-01-01.
constexpr std::int64_t kUnixEpochSeconds = 11644473600;

std::uint64_t ticks_of(const _FILETIME& time);
_FILETIME file_time_of(std::uint64_t ticks);

/// The tick count of seconds since 1970 plus `more` ticks; nullopt before 1601 or beyond 64 bits.
std::optional<std::uint64_t> ticks_of_unix(std::int64_t seconds, std::uint64_t more);

}  // namespace vexa
