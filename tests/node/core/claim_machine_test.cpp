// SPDX-License-Identifier: Apache-2.0
#include "node/core/claim_machine.h"

#include <gtest/gtest.h>

#include <algorithm>

namespace vexa::node {
namespace {

using namespace std::chrono_literals;
using Kind = ClaimRequest::Kind;
using Outcome = ClaimAnswer::Outcome;

// A node with a lease and a site of one camera.
class ClaimMachineTest : public testing::Test {
 protected:
  void begin() {
    answer(one(0ms), Outcome::kDone, 77, 0ms);
    answer(one(0ms), Outcome::kDone, 0, 0ms);
    machine_.list({5, {{SiteEntry::Kind::kCamera, "gate", true, 2}, {SiteEntry::Kind::kNode, "a", true, 4, 10}}}, 0ms);
  }
  // With the camera claimed at 1000 ms with token 6.
  void begin_with_camera() {
    begin();
    answer(one(1000ms), Outcome::kDone, 6, 1000ms);
  }
  std::vector<Kind> kinds(BootTime now) {
    std::vector<Kind> kinds;
    for (const ClaimRequest& request : machine_.next(now)) kinds.push_back(request.kind);
    return kinds;
  }
  ClaimRequest one(BootTime now) {
    const auto requests = machine_.next(now);
    EXPECT_EQ(requests.size(), 1U);
    return requests.empty() ? ClaimRequest{} : requests.front();
  }
  void answer(const ClaimRequest& request, Outcome outcome, std::uint64_t value, BootTime now) {
    machine_.answer({request.number, outcome, value}, now);
  }
  void renew(BootTime now) { answer(one(now), Outcome::kDone, 0, now); }
  void claim_by(const char* owner, std::uint64_t revision, BootTime now) {
    machine_.change({SiteEntry::Kind::kClaim, "gate", true, revision, 0, owner, 99}, now);
  }
  bool records() const { return machine_.recorded().count("gate") == 1; }

  ClaimMachine machine_{"a", 10, ClaimRules{}};
};

TEST_F(ClaimMachineTest, AsksForALeaseThenRegistersThenClaims) {
  const ClaimRequest grant = one(0ms);
  EXPECT_EQ(grant.kind, Kind::kGrant);
  EXPECT_TRUE(machine_.next(0ms).empty());
  answer(grant, Outcome::kDone, 77, 0ms);
  const ClaimRequest put = one(0ms);
  EXPECT_EQ(put.kind, Kind::kRegister);
  EXPECT_EQ(put.lease, 77U);
  answer(put, Outcome::kDone, 0, 0ms);
  machine_.list({5, {{SiteEntry::Kind::kCamera, "gate", true, 2}, {SiteEntry::Kind::kNode, "a", true, 4, 10}}}, 0ms);
  EXPECT_TRUE(machine_.next(999ms).empty());
  const ClaimRequest claim = one(1000ms);
  EXPECT_EQ(claim.kind, Kind::kClaim);
  EXPECT_EQ(claim.camera, "gate");
  EXPECT_EQ(claim.lease, 77U);
  EXPECT_FALSE(records());
  answer(claim, Outcome::kDone, 6, 1000ms);
  EXPECT_TRUE(records());
}

TEST_F(ClaimMachineTest, ATokenCountsOneLeaseAfterTheClaim) {
  begin_with_camera();
  for (const BootTime now : {2000ms, 4000ms, 6000ms}) renew(now);
  EXPECT_EQ(machine_.exclusive_token("gate", 7059ms), std::nullopt);
  EXPECT_EQ(machine_.exclusive_token("gate", 7060ms), 6U);
  EXPECT_EQ(machine_.exclusive_token("yard", 7060ms), std::nullopt);
}

TEST_F(ClaimMachineTest, ATokenEndsWithTheLeaseByTheNodesOwnClockAndRecordingGoesOn) {
  begin_with_camera();
  for (const BootTime now : {2000ms, 4000ms, 6000ms}) renew(now);
  machine_.lose_sight();
  EXPECT_EQ(machine_.exclusive_token("gate", 9939ms), 6U);
  EXPECT_EQ(machine_.exclusive_token("gate", 9940ms), std::nullopt);
  EXPECT_TRUE(records());
}

TEST_F(ClaimMachineTest, ALateAnswerToARenewalCountsFromWhenItWasSent) {
  begin_with_camera();
  const ClaimRequest renewal = one(2000ms);
  answer(renewal, Outcome::kDone, 0, 3900ms);
  EXPECT_EQ(machine_.lease().valid_until(), 2000ms + 3940ms);
}

TEST_F(ClaimMachineTest, ARequestWithoutAnAnswerIsGivenUpAndRepeated) {
  const ClaimRequest grant = one(0ms);
  EXPECT_TRUE(machine_.next(1999ms).empty());
  EXPECT_TRUE(machine_.next(2000ms).empty());
  EXPECT_EQ(kinds(2500ms), std::vector<Kind>{Kind::kGrant});
  answer(grant, Outcome::kDone, 77, 2500ms);
  EXPECT_EQ(machine_.lease().id(), 0U);
}

TEST_F(ClaimMachineTest, WhatItRecordsItClaimsAgainAtOnceWithANewLease) {
  begin_with_camera();
  answer(one(2000ms), Outcome::kRefused, 0, 2000ms);
  EXPECT_EQ(machine_.lease().id(), 0U);
  EXPECT_TRUE(records());
  machine_.change({SiteEntry::Kind::kClaim, "gate", false, 7}, 2000ms);
  machine_.change({SiteEntry::Kind::kNode, "a", false, 7}, 2000ms);
  answer(one(2000ms), Outcome::kDone, 78, 2000ms);
  answer(one(2000ms), Outcome::kDone, 0, 2000ms);
  EXPECT_EQ(one(2000ms).kind, Kind::kClaim);
}

TEST_F(ClaimMachineTest, AnotherNodesClaimEndsTheRecordingAfterAnOverlap) {
  begin_with_camera();
  claim_by("b", 9, 2000ms);
  EXPECT_TRUE(machine_.claimed().empty());
  (void)machine_.next(6999ms);
  EXPECT_TRUE(records());
  EXPECT_LE(machine_.deadline(), 7000ms);
  (void)machine_.next(7000ms);
  EXPECT_FALSE(records());
}

TEST_F(ClaimMachineTest, RecordingGoesOnWhenTheOtherNodesClaimEndsDuringTheOverlap) {
  begin_with_camera();
  claim_by("b", 9, 1500ms);
  machine_.change({SiteEntry::Kind::kClaim, "gate", false, 10}, 1800ms);
  EXPECT_EQ(one(1800ms).kind, Kind::kClaim);
  (void)machine_.next(9000ms);
  EXPECT_TRUE(records());
}

TEST_F(ClaimMachineTest, AnAnswerOlderThanTheWatchIsNotBelieved) {
  begin();
  const ClaimRequest claim = one(1000ms);
  machine_.change({SiteEntry::Kind::kClaim, "gate", true, 6, 0, "a", 77}, 1100ms);
  machine_.change({SiteEntry::Kind::kClaim, "gate", false, 7}, 1200ms);
  answer(claim, Outcome::kDone, 6, 1300ms);
  EXPECT_TRUE(machine_.claimed().empty());
  EXPECT_EQ(machine_.site().claim_of("gate"), nullptr);
}

TEST_F(ClaimMachineTest, AClaimWhoseAnswerWasLostIsKnownByTheWatch) {
  begin();
  answer(one(1000ms), Outcome::kFailed, 0, 1000ms);
  machine_.change({SiteEntry::Kind::kClaim, "gate", true, 6, 0, "a", 77}, 1100ms);
  EXPECT_EQ(machine_.claimed(), std::vector<std::string>{"gate"});
}

TEST_F(ClaimMachineTest, AClaimOfItsFormerLifeIsRecordedAndNotHeld) {
  begin();
  claim_by("a", 6, 500ms);
  EXPECT_TRUE(records());
  EXPECT_TRUE(machine_.claimed().empty());
}

TEST_F(ClaimMachineTest, ARefusedClaimIsNotRepeatedAtOnce) {
  begin();
  answer(one(1000ms), Outcome::kRefused, 0, 1000ms);
  EXPECT_TRUE(machine_.next(1499ms).empty());
  EXPECT_EQ(kinds(1500ms), std::vector<Kind>{Kind::kClaim});
}

TEST_F(ClaimMachineTest, OutOfSightItClaimsNothing) {
  begin();
  machine_.lose_sight();
  EXPECT_TRUE(machine_.next(1000ms).empty());
}

TEST_F(ClaimMachineTest, CapacityBoundsTheClaims) {
  ClaimMachine small("a", 1, ClaimRules{});
  for (const std::uint64_t lease : {77U, 77U})
    small.answer({small.next(0ms).front().number, Outcome::kDone, lease}, 0ms);
  small.list({5,
              {{SiteEntry::Kind::kCamera, "gate", true, 2},
               {SiteEntry::Kind::kCamera, "yard", true, 3},
               {SiteEntry::Kind::kNode, "a", true, 4, 1}}},
             0ms);
  EXPECT_EQ(small.next(1000ms).size(), 1U);
}

TEST_F(ClaimMachineTest, WhileEtcdIsSuspectedItClaimsOnlyWhatItRecords) {
  begin();
  for (const char* node : {"b", "c"}) machine_.change({SiteEntry::Kind::kNode, node, true, 6, 10}, 100ms);
  for (const char* node : {"b", "c"}) machine_.change({SiteEntry::Kind::kNode, node, false, 7}, 1000ms);
  renew(2000ms);
  renew(4000ms);
  renew(6000ms);
  EXPECT_TRUE(machine_.next(6999ms).empty());
  EXPECT_EQ(kinds(7000ms), std::vector<Kind>{Kind::kClaim});
}

TEST_F(ClaimMachineTest, ACameraThatIsGivenAwayIsRecordedUntilAnotherNodeHasIt) {
  begin_with_camera();
  machine_.drain(1500ms);
  const ClaimRequest release = one(1500ms);
  EXPECT_EQ(release.kind, Kind::kRelease);
  EXPECT_EQ(release.token, 6U);
  EXPECT_EQ(machine_.exclusive_token("gate", 60000ms), std::nullopt);
  answer(release, Outcome::kDone, 0, 1500ms);
  machine_.change({SiteEntry::Kind::kClaim, "gate", false, 7}, 1500ms);
  EXPECT_TRUE(records());
  claim_by("b", 9, 1600ms);
  (void)machine_.next(6600ms);
  EXPECT_FALSE(records());
}

// Deleted by a release that was under way, it would seem to last for as long as the lease.
TEST_F(ClaimMachineTest, AClaimThatIsBeingReleasedIsNeverHeldAgain) {
  begin_with_camera();
  machine_.drain(1500ms);
  answer(one(1500ms), Outcome::kFailed, 0, 1500ms);
  machine_.lose_sight();
  machine_.list({8,
                 {{SiteEntry::Kind::kCamera, "gate", true, 2},
                  {SiteEntry::Kind::kNode, "a", true, 4, 10},
                  {SiteEntry::Kind::kClaim, "gate", true, 6, 0, "a", 77}}},
                1600ms);
  EXPECT_TRUE(machine_.claimed().empty());
  EXPECT_EQ(kinds(1700ms), std::vector<Kind>{Kind::kRelease});
}

TEST_F(ClaimMachineTest, ACameraThatTheSiteNoLongerHasIsReleasedAndNotRecorded) {
  begin_with_camera();
  machine_.change({SiteEntry::Kind::kCamera, "gate", false, 8}, 1500ms);
  EXPECT_FALSE(records());
  EXPECT_EQ(kinds(1500ms), std::vector<Kind>{Kind::kRelease});
}

TEST_F(ClaimMachineTest, WhenNothingChangesItAsksLessThanOnceASecond) {
  begin_with_camera();
  std::size_t requests = 0;
  BootTime now = 1000ms;
  while (now < 61000ms) {
    for (const ClaimRequest& request : machine_.next(now)) {
      ++requests;
      answer(request, Outcome::kDone, 0, now);
    }
    ASSERT_GT(machine_.deadline(), now);
    now = machine_.deadline();
  }
  EXPECT_EQ(requests, 30U);  // a renewal every two seconds
}

}  // namespace
}  // namespace vexa::node
