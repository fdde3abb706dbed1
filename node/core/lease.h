// SPDX-License-Identifier: Apache-2.0
// A node's lease in etcd, as far as the node itself can know it.
#pragma once

#include <cstdint>

#include "node/core/boot_time.h"

namespace vexa::node {

/// How long a lease lasts, and how far clocks may be from each other.
struct LeaseTerms {
  BootTime ttl{6000};
  /// By how much the node's clock and etcd's may differ over a stretch of time, together.
  int drift_permille = 10;

  [[nodiscard]] BootTime renewal() const { return ttl / 3; }
  [[nodiscard]] BootTime drift() const { return ttl * drift_permille / 1000; }
};

/// One lease a node. It counts from the moment before the request was sent that etcd answered, as etcd's own count may
/// have begun any time from then on; and it counts as over one interval of renewal early. After that moment the node
/// does nothing that must be done by one node alone.
class Lease {
 public:
  explicit Lease(LeaseTerms terms) : terms_(terms) {}

  /// Granted; `sent` is the moment before the request left.
  void grant(std::uint64_t id, BootTime sent);
  /// A renewal was answered. Answers may come in any order.
  void renew(BootTime sent);
  /// etcd does not know it any more.
  void end() { id_ = 0; }

  [[nodiscard]] std::uint64_t id() const { return id_; }  ///< 0: none
  [[nodiscard]] BootTime valid_until() const { return valid_until_; }
  [[nodiscard]] bool is_valid(BootTime now) const { return id_ != 0 && now < valid_until_; }
  [[nodiscard]] BootTime renewal_due() const { return due_; }
  /// A renewal is about to be sent.
  void renewing(BootTime now) { due_ = now + terms_.renewal(); }

 private:
  const LeaseTerms terms_;
  std::uint64_t id_ = 0;
  BootTime valid_until_{0};
  BootTime due_{0};
};

}  // namespace vexa::node
