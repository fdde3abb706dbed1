// SPDX-License-Identifier: Apache-2.0
// Deadlines on the steady clock, in the milliseconds that poll takes.
#pragma once

#include <chrono>

namespace vexa {

/// Milliseconds from `now` until a moment, rounded up so that no wait ends early; below 0 once it has passed.
inline int milliseconds_until(std::chrono::steady_clock::time_point moment,
                              std::chrono::steady_clock::time_point now = std::chrono::steady_clock::now()) {
  return static_cast<int>(std::chrono::ceil<std::chrono::milliseconds>(moment - now).count());
}

}  // namespace vexa
