// SPDX-License-Identifier: Apache-2.0
// Time as the parts of a node are given it.
#pragma once

#include <chrono>

namespace vexa::node {

/// On the node's CLOCK_BOOTTIME, which is never set and goes on while the machine is suspended. No part has a clock of
/// its own.
using BootTime = std::chrono::milliseconds;

inline constexpr BootTime kNever = BootTime::max();

}  // namespace vexa::node
