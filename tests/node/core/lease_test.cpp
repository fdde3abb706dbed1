// SPDX-License-Identifier: Apache-2.0
#include "node/core/lease.h"

#include <gtest/gtest.h>

namespace vexa::node {
namespace {

using namespace std::chrono_literals;

constexpr LeaseTerms kTerms{6000ms, 10};

TEST(Lease, CountsFromBeforeTheRequestWasSent) {
  Lease lease(kTerms);
  EXPECT_FALSE(lease.is_valid(0ms));
  lease.grant(7, 1000ms);
  // 6000 of TTL, less 60 of drift and the 2000 of one renewal.
  EXPECT_EQ(lease.valid_until(), 4940ms);
  EXPECT_TRUE(lease.is_valid(4939ms));
  EXPECT_FALSE(lease.is_valid(4940ms));
}

TEST(Lease, IsDueAgainAfterAThirdOfItsTime) {
  Lease lease(kTerms);
  lease.grant(7, 1000ms);
  EXPECT_EQ(lease.renewal_due(), 3000ms);
  lease.renewing(3500ms);
  EXPECT_EQ(lease.renewal_due(), 5500ms);
}

TEST(Lease, AnAnswerToAnEarlierRenewalShortensNothing) {
  Lease lease(kTerms);
  lease.grant(7, 1000ms);
  lease.renew(5000ms);
  lease.renew(3000ms);
  EXPECT_EQ(lease.valid_until(), 8940ms);
}

TEST(Lease, EndsWithEtcdsWord) {
  Lease lease(kTerms);
  lease.grant(7, 1000ms);
  lease.end();
  EXPECT_EQ(lease.id(), 0U);
  EXPECT_FALSE(lease.is_valid(1000ms));
}

TEST(Lease, ANewOneOwesNothingToTheOneBefore) {
  Lease lease(kTerms);
  lease.grant(7, 9000ms);
  lease.end();
  lease.grant(8, 1000ms);
  EXPECT_EQ(lease.valid_until(), 4940ms);
}

}  // namespace
}  // namespace vexa::node
