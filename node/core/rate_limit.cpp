// SPDX-License-Identifier: Apache-2.0
#include "node/core/rate_limit.h"

#include <algorithm>

namespace vexa::node {

bool RateLimit::take(BootTime now) {
  if (now > filled_) {
    const std::int64_t needed = (full_ - level_) / per_second_ + 1;  // milliseconds until it is full
    level_ = std::min(full_, level_ + per_second_ * std::min<std::int64_t>((now - filled_).count(), needed));
    filled_ = now;
  }
  if (level_ < 1000) return false;
  level_ -= 1000;
  return true;
}

}  // namespace vexa::node
