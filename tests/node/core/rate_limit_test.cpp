// SPDX-License-Identifier: Apache-2.0
#include "node/core/rate_limit.h"

#include <gtest/gtest.h>

namespace vexa::node {
namespace {

using namespace std::chrono_literals;

TEST(RateLimit, AllowsABurstAndThenItsRate) {
  RateLimit limit(2, 3);
  for (int i = 0; i < 3; ++i) EXPECT_TRUE(limit.take(1000ms)) << i;
  EXPECT_FALSE(limit.take(1000ms));
  EXPECT_FALSE(limit.take(1499ms));
  EXPECT_TRUE(limit.take(1500ms));
  EXPECT_FALSE(limit.take(1500ms));
}

TEST(RateLimit, ALongRestAllowsNoMoreThanTheBurst) {
  RateLimit limit(2, 3);
  for (int i = 0; i < 3; ++i) EXPECT_TRUE(limit.take(1000ms)) << i;
  int taken = 0;
  while (limit.take(BootTime::max() / 2)) ++taken;
  EXPECT_EQ(taken, 3);
}

}  // namespace
}  // namespace vexa::node
