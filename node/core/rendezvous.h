// SPDX-License-Identifier: Apache-2.0
// Which node should record a camera: weighted rendezvous hashing.
#pragma once

#include <cstdint>
#include <string_view>

namespace vexa::node {

/// Spreads names over 64 bits. The same on every machine and in every version: nodes of a site must agree.
std::uint64_t name_hash(std::string_view name);

/// The node with the lowest cost should have the camera. Each camera prefers a node with a probability in proportion to
/// its capacity; a node that comes or goes changes the first choice of its own cameras alone. Computed in integers, so
/// that nodes of different machines agree. Both hashes by name_hash; a capacity of 0 costs most of all.
std::uint64_t rendezvous_cost(std::uint64_t camera, std::uint64_t node, std::uint32_t capacity);

}  // namespace vexa::node
