// SPDX-License-Identifier: Apache-2.0
#include "node/core/rendezvous.h"

#include <gtest/gtest.h>

#include <array>
#include <cmath>
#include <limits>
#include <string>

namespace vexa::node {
namespace {

// Nodes of a site may be of different machines and versions.
TEST(Rendezvous, NamesAndCostsAreTheSameEverywhere) {
  EXPECT_EQ(name_hash(""), 0xf52a15e9a9b5e89bU);
  EXPECT_EQ(name_hash("camera-1"), 10369683898732493864U);
  EXPECT_EQ(rendezvous_cost(1, 2, 3), 1019681070645248U);
}

TEST(Rendezvous, ANodeWithoutCapacityCostsMost) {
  EXPECT_EQ(rendezvous_cost(1, 2, 0), std::numeric_limits<std::uint64_t>::max());
  EXPECT_LT(rendezvous_cost(1, 2, 1), std::numeric_limits<std::uint64_t>::max());
}

TEST(Rendezvous, CamerasFallToNodesInProportionToTheirCapacity) {
  constexpr std::array<std::uint32_t, 4> kCapacities = {100, 200, 300, 400};
  constexpr int kCameras = 20000;
  std::array<int, kCapacities.size()> won{};
  for (int camera = 0; camera < kCameras; ++camera) {
    std::size_t best = 0;
    std::uint64_t least = std::numeric_limits<std::uint64_t>::max();
    for (std::size_t node = 0; node < kCapacities.size(); ++node) {
      const std::uint64_t cost = rendezvous_cost(name_hash("camera-" + std::to_string(camera)),
                                                 name_hash("node-" + std::to_string(node)), kCapacities[node]);
      if (cost < least) best = node;
      least = std::min(least, cost);
    }
    ++won[best];
  }
  for (std::size_t node = 0; node < kCapacities.size(); ++node) {
    const double share = kCapacities[node] / 1000.0;
    const double deviation = std::sqrt(kCameras * share * (1 - share));
    EXPECT_NEAR(won[node], kCameras * share, 4 * deviation) << "node " << node;
  }
}

}  // namespace
}  // namespace vexa::node
