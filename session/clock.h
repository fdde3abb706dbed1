// SPDX-License-Identifier: Apache-2.0
// The clock of sessions.
#pragma once

#include <chrono>

#include "session/core/moment.h"

namespace vexa {

/// CLOCK_MONOTONIC, which nobody sets: neither the wall clock nor its steps matter to a session.
inline Moment monotonic_now() {
  return std::chrono::duration_cast<Moment>(std::chrono::steady_clock::now().time_since_epoch());
}

}  // namespace vexa
