// SPDX-License-Identifier: Apache-2.0
// etcd as far as nodes use it: keys with leases, revisions, transactions, a log of changes.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "node/core/claim_machine.h"

namespace vexa_test {

/// One server without a network: whoever calls it has carried the request there. Times are milliseconds of etcd's
/// clock.
class SimulatedEtcd {
 public:
  explicit SimulatedEtcd(std::int64_t ttl) : ttl_(ttl) {}

  void add_camera(const std::string& name);
  vexa::node::ClaimAnswer execute(const vexa::node::ClaimRequest& request, const std::string& node,
                                  std::uint32_t capacity, std::int64_t now);
  /// Deletes what was put with leases that are over.
  void expire(std::int64_t now);
  void end_lease(std::uint64_t lease);
  /// All leases end at once.
  void revoke_all();
  /// As a new leader does: every lease lasts from now on.
  void restart_leases(std::int64_t now);

  [[nodiscard]] vexa::node::SiteList list() const;
  /// All changes there were, in the order of their revisions.
  [[nodiscard]] const std::vector<vexa::node::SiteEntry>& log() const { return log_; }
  [[nodiscard]] std::uint64_t requests() const { return requests_; }

 private:
  using Key = std::pair<vexa::node::SiteEntry::Kind, std::string>;

  bool put(vexa::node::SiteEntry entry, std::uint64_t lease);
  void remove(Key key, std::uint64_t revision);

  const std::int64_t ttl_;
  std::uint64_t revision_ = 1;
  std::uint64_t last_lease_ = 0;
  std::uint64_t requests_ = 0;
  std::map<std::uint64_t, std::int64_t> leases_;  // with their end
  std::map<Key, vexa::node::SiteEntry> keys_;     // with the create revision
  std::vector<vexa::node::SiteEntry> log_;
};

}  // namespace vexa_test
