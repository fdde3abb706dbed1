// SPDX-License-Identifier: Apache-2.0
#include "node/core/site_view.h"

#include <gtest/gtest.h>

namespace vexa::node {
namespace {

using namespace std::chrono_literals;
using Kind = SiteEntry::Kind;

class SiteViewTest : public testing::Test {
 protected:
  bool camera(const char* name, std::uint64_t revision, bool present = true) {
    return view_.apply({Kind::kCamera, name, present, revision}, 5ms);
  }
  bool claim(const char* name, std::uint64_t revision, const char* owner) {
    return view_.apply({Kind::kClaim, name, true, revision, 0, owner, 9}, 6ms);
  }
  bool claim_gone(const char* name, std::uint64_t revision) {
    return view_.apply({Kind::kClaim, name, false, revision}, 7ms);
  }

  SiteView view_;
};

TEST_F(SiteViewTest, ACameraIsUnclaimedFromItsListingToItsClaimAndAfterThat) {
  EXPECT_TRUE(camera("gate", 2));
  EXPECT_EQ(view_.unclaimed().at("gate").since, 5ms);
  EXPECT_TRUE(claim("gate", 3, "a"));
  EXPECT_TRUE(view_.unclaimed().empty());
  EXPECT_EQ(view_.claim_of("gate")->token, 3U);
  EXPECT_TRUE(claim_gone("gate", 4));
  EXPECT_EQ(view_.unclaimed().at("gate").since, 7ms);
}

TEST_F(SiteViewTest, WhatIsOlderThanWhatIsKnownIsIgnored) {
  camera("gate", 2);
  claim("gate", 5, "b");
  EXPECT_FALSE(claim("gate", 3, "a"));
  EXPECT_FALSE(claim("gate", 5, "b"));
  EXPECT_FALSE(claim_gone("gate", 4));
  EXPECT_FALSE(camera("gate", 1, false));
  EXPECT_EQ(view_.claim_of("gate")->owner, "b");
}

TEST_F(SiteViewTest, ACameraThatIsGoneIsNotUnclaimed) {
  camera("gate", 2);
  EXPECT_TRUE(camera("gate", 3, false));
  EXPECT_TRUE(view_.unclaimed().empty());
  EXPECT_FALSE(claim_gone("gate", 4));
  EXPECT_TRUE(view_.unclaimed().empty());
}

TEST_F(SiteViewTest, AListRemovesWhatIsNotInItUnlessThatIsNewer) {
  camera("gate", 2);
  camera("yard", 3);
  claim("gate", 4, "a");
  claim("yard", 9, "a");  // made after the list
  const SiteList list{8, {{Kind::kCamera, "gate", true, 2}, {Kind::kCamera, "yard", true, 3}}};
  for (const SiteEntry& entry : view_.changes_to(list)) view_.apply(entry, 10ms);
  EXPECT_EQ(view_.claim_of("gate"), nullptr);
  EXPECT_EQ(view_.unclaimed().at("gate").since, 10ms);
  ASSERT_NE(view_.claim_of("yard"), nullptr);
}

TEST_F(SiteViewTest, AFullNodeIsNotBetterThanAnother) {
  view_.apply({Kind::kNode, "a", true, 2, 1}, 0ms);
  view_.apply({Kind::kNode, "b", true, 3, 1}, 0ms);
  camera("gate", 4);
  const std::uint64_t hash = view_.unclaimed().at("gate").hash;
  const std::string best = view_.best_node(hash);
  const std::string other = best == "a" ? "b" : "a";
  EXPECT_EQ(view_.better_nodes(hash, other), 1U);
  claim("yard", 5, best.c_str());
  EXPECT_EQ(view_.better_nodes(hash, other), 0U);
  EXPECT_EQ(view_.best_node(hash), best);
}

}  // namespace
}  // namespace vexa::node
