// SPDX-License-Identifier: Apache-2.0
#include "node/core/suspicion.h"

#include <algorithm>

namespace vexa::node {

void Suspicion::vanished(std::size_t before, BootTime now) {
  while (!losses_.empty() && now - losses_.front().at > ttl_) losses_.pop_front();
  losses_.push_back({now, before});
  std::size_t most = 0;
  for (const Loss& loss : losses_) most = std::max(most, loss.before);
  constexpr std::size_t kPercent = 30;
  if (losses_.size() >= 2 && losses_.size() * 100 > most * kPercent) until_ = now + ttl_;
}

}  // namespace vexa::node
