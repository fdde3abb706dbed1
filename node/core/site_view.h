// SPDX-License-Identifier: Apache-2.0
// A site's cameras, nodes and claims, as a node last saw them in etcd.
#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "node/core/boot_time.h"

namespace vexa::node {

/// One key of the site, or that it is gone.
struct SiteEntry {
  enum class Kind { kCamera, kNode, kClaim };

  Kind kind = Kind::kCamera;
  std::string name = {};       ///< of the camera, of the node, of the claimed camera
  bool present = true;         ///< false: deleted at `revision`
  std::uint64_t revision = 0;  ///< its create revision: of a claim, the fencing token
  std::uint32_t capacity = 0;  ///< of a node, in cameras
  std::string owner = {};      ///< of a claim, the node's name
  std::uint64_t lease = 0;     ///< of a claim
};

/// All keys of the site at one revision.
struct SiteList {
  std::uint64_t revision = 0;
  std::vector<SiteEntry> entries;
};

/// Holds no key of its own: fed by lists and by watched changes. Changes older than what is known are ignored.
class SiteView {
 public:
  struct Node {
    std::uint64_t hash = 0;
    std::uint32_t capacity = 0;
    std::uint64_t revision = 0;
    BootTime seen{0};  ///< when it appeared here
  };
  struct Claim {
    std::string owner;
    std::uint64_t lease = 0;
    std::uint64_t token = 0;
  };
  struct Unclaimed {
    std::uint64_t hash = 0;
    BootTime since{0};
    BootTime not_before{0};  ///< the next try to claim it
  };

  /// False where it is old, or nothing new.
  bool apply(const SiteEntry& entry, BootTime now);
  /// What has changed from this view to the list.
  [[nodiscard]] std::vector<SiteEntry> changes_to(const SiteList& list) const;

  [[nodiscard]] const std::map<std::string, Node>& nodes() const { return nodes_; }
  [[nodiscard]] std::map<std::string, Unclaimed>& unclaimed() { return unclaimed_; }
  [[nodiscard]] const std::map<std::string, Unclaimed>& unclaimed() const { return unclaimed_; }
  [[nodiscard]] const Claim* claim_of(const std::string& camera) const;
  [[nodiscard]] bool has_room(const std::string& node, const Node& row) const;

  /// How many nodes with room for one more camera should have this one rather than `node`.
  [[nodiscard]] std::size_t better_nodes(std::uint64_t camera, const std::string& node) const;
  /// The name of the node that should have the camera, whether it has room or not; empty without nodes.
  [[nodiscard]] std::string best_node(std::uint64_t camera) const;

 private:
  bool apply_camera(const SiteEntry& entry, BootTime now);
  bool apply_node(const SiteEntry& entry, BootTime now);
  bool apply_claim(const SiteEntry& entry, BootTime now);
  void note_unclaimed(const std::string& camera, BootTime now);

  std::map<std::string, std::uint64_t> cameras_;  // with the create revision
  std::map<std::string, Node> nodes_;
  std::map<std::string, Claim> claims_;
  std::map<std::string, std::size_t> claims_of_;  // by node
  std::map<std::string, Unclaimed> unclaimed_;
};

}  // namespace vexa::node
