// SPDX-License-Identifier: Apache-2.0
// Bounds how often something is done.
#pragma once

#include <cstdint>

#include "node/core/boot_time.h"

namespace vexa::node {

/// A token bucket: up to `burst` at once, and `per_second` in the long run. Both from 1.
class RateLimit {
 public:
  RateLimit(std::uint32_t per_second, std::uint32_t burst)
      : per_second_(per_second), full_(std::int64_t{burst} * 1000), level_(full_) {}

  /// Whether it may be done now; then it counts.
  bool take(BootTime now);

 private:
  const std::int64_t per_second_;
  const std::int64_t full_;  // in thousandths, as per_second_ is once a millisecond
  std::int64_t level_;
  BootTime filled_{0};
};

}  // namespace vexa::node
