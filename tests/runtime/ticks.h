// SPDX-License-Identifier: Apache-2.0
// Counts of 100 ns since 1601, and the fields of a system time side by side.
#pragma once

#include <array>
#include <cstdint>

#include "runtime/file_time.h"
#include "vexa/real_time.h"
#include "vexa/runtime.h"

namespace vexa::test {

inline std::uint64_t ticks_in(const CRealTime& time) { return ticks_of(time.GetUtcFileTime()); }

inline std::uint64_t ticks_at(std::int64_t unix_seconds, std::uint64_t more = 0) {
  return static_cast<std::uint64_t>(unix_seconds + 11644473600) * 10000000 + more;
}

inline std::array<int, 8> listed(const _SYSTEMTIME& f) {
  return {f.wYear, f.wMonth, f.wDayOfWeek, f.wDay, f.wHour, f.wMinute, f.wSecond, f.wMilliseconds};
}

}  // namespace vexa::test
