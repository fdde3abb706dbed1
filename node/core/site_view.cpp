// SPDX-License-Identifier: Apache-2.0
#include "node/core/site_view.h"

#include <set>
#include <tuple>
#include <utility>

#include "node/core/rendezvous.h"

namespace vexa::node {
namespace {

using Place = std::tuple<std::uint64_t, const std::string&>;

Place place_of(std::uint64_t camera, const std::string& name, const SiteView::Node& node) {
  return {rendezvous_cost(camera, node.hash, node.capacity), name};
}

SiteEntry gone(SiteEntry::Kind kind, const std::string& name, std::uint64_t revision) {
  SiteEntry entry;
  entry.kind = kind;
  entry.name = name;
  entry.present = false;
  entry.revision = revision;
  return entry;
}

}  // namespace

bool SiteView::apply(const SiteEntry& entry, BootTime now) {
  switch (entry.kind) {
    case SiteEntry::Kind::kCamera:
      return apply_camera(entry, now);
    case SiteEntry::Kind::kNode:
      return apply_node(entry, now);
    case SiteEntry::Kind::kClaim:
      return apply_claim(entry, now);
  }
  return false;
}

bool SiteView::apply_camera(const SiteEntry& entry, BootTime now) {
  const auto known = cameras_.find(entry.name);
  if (!entry.present) {
    if (known == cameras_.end() || known->second > entry.revision) return false;
    cameras_.erase(known);
    unclaimed_.erase(entry.name);
    return true;
  }
  if (known != cameras_.end() && known->second >= entry.revision) return false;
  cameras_[entry.name] = entry.revision;
  note_unclaimed(entry.name, now);
  return true;
}

bool SiteView::apply_node(const SiteEntry& entry, BootTime now) {
  const auto known = nodes_.find(entry.name);
  if (!entry.present) {
    if (known == nodes_.end() || known->second.revision > entry.revision) return false;
    nodes_.erase(known);
    return true;
  }
  if (known != nodes_.end() && known->second.revision >= entry.revision) return false;
  nodes_[entry.name] = {name_hash(entry.name), entry.capacity, entry.revision, now};
  return true;
}

bool SiteView::apply_claim(const SiteEntry& entry, BootTime now) {
  const auto known = claims_.find(entry.name);
  if (known != claims_.end()) {
    if (known->second.token > entry.revision || (entry.present && known->second.token == entry.revision)) return false;
    --claims_of_[known->second.owner];
    claims_.erase(known);
  } else if (!entry.present) {
    return false;
  }
  if (!entry.present) {
    note_unclaimed(entry.name, now);
    return true;
  }
  claims_[entry.name] = {entry.owner, entry.lease, entry.revision};
  ++claims_of_[entry.owner];
  unclaimed_.erase(entry.name);
  return true;
}

void SiteView::note_unclaimed(const std::string& camera, BootTime now) {
  if (cameras_.count(camera) == 0 || claims_.count(camera) != 0) return;
  unclaimed_[camera] = {name_hash(camera), now, now};
}

std::vector<SiteEntry> SiteView::changes_to(const SiteList& list) const {
  std::vector<SiteEntry> changes;
  std::set<std::string> present[3];
  for (const SiteEntry& entry : list.entries) present[static_cast<int>(entry.kind)].insert(entry.name);
  const auto note_missing = [&](SiteEntry::Kind kind, const auto& known, auto revision_of) {
    for (const auto& [name, row] : known) {
      const bool newer = revision_of(row) > list.revision;
      if (!newer && present[static_cast<int>(kind)].count(name) == 0)
        changes.push_back(gone(kind, name, list.revision));
    }
  };
  note_missing(SiteEntry::Kind::kCamera, cameras_, [](std::uint64_t revision) { return revision; });
  note_missing(SiteEntry::Kind::kNode, nodes_, [](const Node& node) { return node.revision; });
  note_missing(SiteEntry::Kind::kClaim, claims_, [](const Claim& claim) { return claim.token; });
  changes.insert(changes.end(), list.entries.begin(), list.entries.end());
  return changes;
}

const SiteView::Claim* SiteView::claim_of(const std::string& camera) const {
  const auto found = claims_.find(camera);
  return found == claims_.end() ? nullptr : &found->second;
}

bool SiteView::has_room(const std::string& node, const Node& row) const {
  const auto found = claims_of_.find(node);
  return found == claims_of_.end() ? row.capacity > 0 : found->second < row.capacity;
}

std::size_t SiteView::better_nodes(std::uint64_t camera, const std::string& node) const {
  const auto own = nodes_.find(node);
  if (own == nodes_.end()) return nodes_.size();
  const Place place = place_of(camera, node, own->second);
  std::size_t better = 0;
  for (const auto& [name, row] : nodes_) {
    if (place_of(camera, name, row) < place && has_room(name, row)) ++better;
  }
  return better;
}

std::string SiteView::best_node(std::uint64_t camera) const {
  std::pair<std::uint64_t, std::string> best;
  for (const auto& [name, row] : nodes_) {
    const std::uint64_t cost = rendezvous_cost(camera, row.hash, row.capacity);
    if (best.second.empty() || cost < best.first) best = {cost, name};
  }
  return best.second;
}

}  // namespace vexa::node
