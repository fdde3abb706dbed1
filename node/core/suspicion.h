// SPDX-License-Identifier: Apache-2.0
// Nodes that vanish together: is it they, or etcd?
#pragma once

#include <cstddef>
#include <deque>

#include "node/core/boot_time.h"

namespace vexa::node {

/// Nodes fail one by one; a stalled leader of etcd can end all leases at once. When two nodes or more, and more than 30
/// of 100, vanish within one lease, etcd is suspected, and nobody takes over cameras for the time of one more lease:
/// nodes that live come back within it and keep what they have.
class Suspicion {
 public:
  explicit Suspicion(BootTime ttl) : ttl_(ttl) {}

  /// One node is gone, of `before` with it.
  void vanished(std::size_t before, BootTime now);
  [[nodiscard]] bool suspects(BootTime now) const { return now < until_; }

 private:
  struct Loss {
    BootTime at;
    std::size_t before;
  };

  const BootTime ttl_;
  std::deque<Loss> losses_;  // of the latest ttl_
  BootTime until_{BootTime::min()};
};

}  // namespace vexa::node
