// SPDX-License-Identifier: Apache-2.0
#include "node/core/lease.h"

#include <algorithm>

namespace vexa::node {

void Lease::grant(std::uint64_t id, BootTime sent) {
  id_ = id;
  valid_until_ = BootTime(0);
  due_ = sent + terms_.renewal();
  renew(sent);
}

void Lease::renew(BootTime sent) {
  valid_until_ = std::max(valid_until_, sent + terms_.ttl - terms_.drift() - terms_.renewal());
}

}  // namespace vexa::node
