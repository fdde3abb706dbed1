// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <rapidcheck.h>

#include <set>
#include <string>
#include <vector>

#include "node/core/rate_limit.h"
#include "node/core/rendezvous.h"
#include "node/core/site_view.h"

namespace vexa::node {
namespace {

// A site of up to 12 nodes of any capacities.
SiteView any_site(std::vector<std::string>& names) {
  SiteView view;
  const int nodes = *rc::gen::inRange(1, 13);
  for (int i = 0; i < nodes; ++i) {
    names.push_back("node-" + std::to_string(*rc::gen::inRange(0, 1000)));
    view.apply({SiteEntry::Kind::kNode, names.back(), true, static_cast<std::uint64_t>(i + 1),
                *rc::gen::inRange<std::uint32_t>(1, 5000)},
               BootTime(0));
  }
  return view;
}

TEST(RendezvousProperty, ANodeThatGoesMovesItsOwnCamerasAlone) {
  EXPECT_TRUE(rc::check([] {
    std::vector<std::string> names;
    const SiteView before = any_site(names);
    const std::string lost = *rc::gen::elementOf(names);
    SiteView after = before;
    after.apply({SiteEntry::Kind::kNode, lost, false, 100}, BootTime(0));
    const std::uint64_t camera = *rc::gen::arbitrary<std::uint64_t>();
    if (before.best_node(camera) != lost) RC_ASSERT(after.best_node(camera) == before.best_node(camera));
    RC_ASSERT(after.best_node(camera) != lost);
  }));
}

TEST(RendezvousProperty, ANodeThatComesTakesCamerasToItselfAlone) {
  EXPECT_TRUE(rc::check([] {
    std::vector<std::string> names;
    const SiteView before = any_site(names);
    SiteView after = before;
    after.apply({SiteEntry::Kind::kNode, "new", true, 100, *rc::gen::inRange<std::uint32_t>(1, 5000)}, BootTime(0));
    const std::uint64_t camera = *rc::gen::arbitrary<std::uint64_t>();
    RC_ASSERT(after.best_node(camera) == before.best_node(camera) || after.best_node(camera) == "new");
  }));
}

TEST(RendezvousProperty, EveryNodeHasAPlaceOfItsOwnForACamera) {
  EXPECT_TRUE(rc::check([] {
    std::vector<std::string> names;
    const SiteView view = any_site(names);
    const std::uint64_t camera = *rc::gen::arbitrary<std::uint64_t>();
    std::set<std::size_t> places;
    for (const auto& [name, node] : view.nodes()) places.insert(view.better_nodes(camera, name));
    RC_ASSERT(places.size() == view.nodes().size());
    RC_ASSERT(view.better_nodes(camera, view.best_node(camera)) == 0U);
  }));
}

TEST(RateLimitProperty, NoStretchOfTimeHasMoreThanBurstAndRate) {
  EXPECT_TRUE(rc::check([] {
    const auto rate = *rc::gen::inRange<std::uint32_t>(1, 50);
    const auto burst = *rc::gen::inRange<std::uint32_t>(1, 50);
    RateLimit limit(rate, burst);
    std::vector<BootTime> taken;
    BootTime now(*rc::gen::inRange(0, 100000));
    for (const int wait : *rc::gen::container<std::vector<int>>(rc::gen::inRange(0, 300))) {
      now += BootTime(wait);
      while (limit.take(now)) taken.push_back(now);
    }
    for (std::size_t i = 0; i < taken.size(); ++i) {
      const auto stretch = (now - taken[i]).count();
      RC_ASSERT((taken.size() - i) * 1000 <= burst * 1000 + static_cast<std::uint64_t>(stretch) * rate + 1000);
    }
  }));
}

}  // namespace
}  // namespace vexa::node
