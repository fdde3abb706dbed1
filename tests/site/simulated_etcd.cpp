// SPDX-License-Identifier: Apache-2.0
#include "tests/site/simulated_etcd.h"

namespace vexa_test {

using vexa::node::ClaimAnswer;
using vexa::node::ClaimRequest;
using vexa::node::SiteEntry;
using vexa::node::SiteList;

void SimulatedEtcd::add_camera(const std::string& name) { put({SiteEntry::Kind::kCamera, name}, 0); }

ClaimAnswer SimulatedEtcd::execute(const ClaimRequest& request, const std::string& node, std::uint32_t capacity,
                                   std::int64_t now) {
  ++requests_;
  ClaimAnswer answer{request.number, ClaimAnswer::Outcome::kRefused};
  const auto lease = leases_.find(request.lease);
  bool done = false;
  switch (request.kind) {
    case ClaimRequest::Kind::kGrant:
      leases_[++last_lease_] = now + ttl_;
      answer.value = last_lease_;
      done = true;
      break;
    case ClaimRequest::Kind::kRenew:
      done = lease != leases_.end();
      if (done) lease->second = now + ttl_;
      break;
    case ClaimRequest::Kind::kRegister: {
      const auto own = keys_.find({SiteEntry::Kind::kNode, node});
      done = own != keys_.end() ? own->second.lease == request.lease
                                : put({SiteEntry::Kind::kNode, node, true, 0, capacity}, request.lease);
      break;
    }
    case ClaimRequest::Kind::kClaim:
      done = put({SiteEntry::Kind::kClaim, request.camera, true, 0, 0, node}, request.lease);
      answer.value = revision_;
      break;
    case ClaimRequest::Kind::kRelease: {
      const auto claim = keys_.find({SiteEntry::Kind::kClaim, request.camera});
      done = claim != keys_.end() && claim->second.revision == request.token;
      if (done) remove(claim->first, ++revision_);
      break;
    }
  }
  if (done) answer.outcome = ClaimAnswer::Outcome::kDone;
  return answer;
}

void SimulatedEtcd::expire(std::int64_t now) {
  std::vector<std::uint64_t> over;
  for (const auto& [lease, end] : leases_) {
    if (end <= now) over.push_back(lease);
  }
  for (const std::uint64_t lease : over) end_lease(lease);
}

void SimulatedEtcd::revoke_all() {
  while (!leases_.empty()) end_lease(leases_.begin()->first);
}

void SimulatedEtcd::restart_leases(std::int64_t now) {
  for (auto& [lease, end] : leases_) end = now + ttl_;
}

SiteList SimulatedEtcd::list() const {
  SiteList list;
  list.revision = revision_;
  for (const auto& [key, entry] : keys_) list.entries.push_back(entry);
  return list;
}

bool SimulatedEtcd::put(SiteEntry entry, std::uint64_t lease) {
  const Key key(entry.kind, entry.name);
  if (keys_.count(key) != 0 || (lease != 0 && leases_.count(lease) == 0)) return false;
  if (lease == 0 && entry.kind != SiteEntry::Kind::kCamera) return false;
  entry.revision = ++revision_;
  entry.lease = lease;
  keys_[key] = entry;
  log_.push_back(entry);
  return true;
}

void SimulatedEtcd::remove(Key key, std::uint64_t revision) {
  const auto found = keys_.find(key);
  SiteEntry entry = found->second;
  keys_.erase(found);
  entry.present = false;
  entry.revision = revision;
  log_.push_back(entry);
}

// All its keys go in one revision.
void SimulatedEtcd::end_lease(std::uint64_t lease) {
  leases_.erase(lease);
  std::vector<Key> keys;
  for (const auto& [key, entry] : keys_) {
    if (entry.lease == lease) keys.push_back(key);
  }
  if (keys.empty()) return;
  ++revision_;
  for (const Key& key : keys) remove(key, revision_);
}

}  // namespace vexa_test
