// SPDX-License-Identifier: Apache-2.0
// Time as the session's parts are given it.
#pragma once

#include <chrono>

namespace vexa {

/// On a clock that is never set, since any beginning. The parts of a session have no clock of their own.
using Moment = std::chrono::milliseconds;

inline constexpr Moment kNever = Moment::max();

}  // namespace vexa
