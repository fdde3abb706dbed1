// SPDX-License-Identifier: Apache-2.0
#include "tests/site/simulated_site.h"

#include <gtest/gtest.h>

#include "tests/site/random_faults.h"

namespace vexa_test {
namespace {

SiteSetup setup_of(std::size_t nodes, std::size_t cameras, std::uint64_t seed = 1) {
  SiteSetup setup;
  setup.nodes = nodes;
  setup.cameras = cameras;
  setup.capacity = static_cast<std::uint32_t>(cameras);
  setup.seed = seed;
  return setup;
}

// After half a minute without faults every node has its cameras.
constexpr std::int64_t kSettled = 40000;

TEST(SimulatedSite, EveryCameraIsRecordedByTheNodeThatShouldHaveIt) {
  SimulatedSite site(setup_of(5, 25));
  site.run(kSettled);
  EXPECT_EQ(site.report().unrecorded, 0U);
  EXPECT_EQ(site.report().misplaced, 0U);
}

TEST(SimulatedSite, ADeadNodesCamerasAreTakenOverWithinTenSecondsAndNoOthersMove) {
  SimulatedSite site(setup_of(5, 25));
  site.run(kSettled);
  const std::uint64_t before = site.report().moves;
  const std::size_t had = site.machine(0).claimed().size();
  site.crash(0);
  site.run(kSettled + 30000);
  EXPECT_GT(had, 0U);
  EXPECT_EQ(site.report().moves - before, had);
  EXPECT_EQ(site.report().unrecorded, 0U);
  EXPECT_LE(site.report().longest_gap, 10000);
}

TEST(SimulatedSite, ANodeThatComesBackGetsItsCamerasWithoutAGap) {
  SimulatedSite site(setup_of(5, 25));
  site.run(kSettled);
  site.crash(0);
  site.run(kSettled + 30000);
  const SiteReport before = site.report();
  site.start(0);
  site.run(kSettled + 70000);
  EXPECT_GT(site.machine(0).claimed().size(), 0U);
  EXPECT_EQ(site.report().moves - before.moves, site.machine(0).claimed().size());
  EXPECT_EQ(site.report().gaps, before.gaps);
  EXPECT_EQ(site.report().misplaced, 0U);
}

TEST(SimulatedSite, WithoutEtcdAllNodesGoOnRecording) {
  SimulatedSite site(setup_of(5, 25));
  site.run(kSettled);
  const SiteReport before = site.report();
  site.etcd_away(60000);
  site.run(kSettled + 50000);
  EXPECT_EQ(site.report().unrecorded, 0U);
  site.run(kSettled + 120000);
  EXPECT_EQ(site.report().gaps, before.gaps);
  EXPECT_EQ(site.report().moves, before.moves);
}

TEST(SimulatedSite, LeasesThatAllEndAtOnceMoveNoCamera) {
  SimulatedSite site(setup_of(5, 25));
  site.run(kSettled);
  const SiteReport before = site.report();
  site.revoke_all();
  site.run(kSettled + 40000);
  EXPECT_EQ(site.report().gaps, before.gaps);
  EXPECT_EQ(site.report().moves, before.moves);
  EXPECT_EQ(site.report().misplaced, 0U);
}

TEST(SimulatedSite, ADrainedNodesCamerasMoveWithoutAGap) {
  SimulatedSite site(setup_of(5, 25));
  site.run(kSettled);
  const SiteReport before = site.report();
  site.drain(0);
  site.run(kSettled + 60000);
  EXPECT_TRUE(site.machine(0).recorded().empty());
  EXPECT_EQ(site.report().unrecorded, 0U);
  EXPECT_EQ(site.report().gaps, before.gaps);
}

// Its lease ends while it cannot know.
SiteReport lose_a_lease(int clock_error_permille, std::uint64_t seed) {
  SiteSetup setup = setup_of(4, 12, seed);
  setup.clock_error_permille = clock_error_permille;
  SimulatedSite site(setup);
  site.run(kSettled);
  site.cut(0, 20000);
  site.revoke_lease_of(0);
  site.run(kSettled + 30000);
  return site.report();
}

TEST(SimulatedSite, ALeaseThatEndsEarlyLeavesOneValidToken) {
  for (std::uint64_t seed = 1; seed <= 5; ++seed) EXPECT_EQ(lose_a_lease(4, seed).double_tokens, 0U) << seed;
}

TEST(SimulatedSite, FindsTwoValidTokensWhenClocksDifferByFarMoreThanTheRulesAllow) {
  std::uint64_t found = 0;
  for (std::uint64_t seed = 1; seed <= 10; ++seed) found += lose_a_lease(600, seed).double_tokens;
  EXPECT_GT(found, 0U);
}

TEST(SimulatedSite, TheSameSeedGivesTheSameRun) {
  const auto moves = [](std::uint64_t seed) {
    const SiteSetup setup = setup_of(5, 20, seed);
    SimulatedSite site(setup);
    plan_faults(site, setup, 10000, 60000);
    site.run(60000);
    return std::make_pair(site.report().moves, site.report().requests);
  };
  EXPECT_EQ(moves(3), moves(3));
  EXPECT_NE(moves(3), moves(4));
}

// More of these by site-simulation.
TEST(SimulatedSite, AnyFaultsLeaveOneValidTokenAndEveryCameraRecorded) {
  for (std::uint64_t seed = 1; seed <= 3; ++seed) {
    const SiteSetup setup = setup_of(8, 16, seed);
    SimulatedSite site(setup);
    plan_faults(site, setup, 20000, 80000);
    site.run(180000);
    EXPECT_EQ(site.report().double_tokens, 0U) << seed;
    EXPECT_LE(site.report().longest_gap, 30000) << seed;
    EXPECT_EQ(site.report().unrecorded, 0U) << seed;
    EXPECT_EQ(site.report().misplaced, 0U) << seed;
  }
}

}  // namespace
}  // namespace vexa_test
