// SPDX-License-Identifier: Apache-2.0
// The waits between a session's attempts.
#include "session/core/back_off.h"

#include <gtest/gtest.h>

namespace vexa {
namespace {

TEST(BackOff, TheLimitDoublesFromOneSecondToThirty) {
  BackOff back_off;
  const int limits[] = {1000, 2000, 4000, 8000, 16000, 30000, 30000, 30000};
  for (const int limit : limits) {
    EXPECT_EQ(back_off.limit(), Moment(limit));
    EXPECT_EQ(back_off.next(1.0), Moment(limit));
  }
}

TEST(BackOff, AWaitIsDrawnFromTheWholeRangeUpToTheLimit) {
  const struct {
    double chance;
    int wait;
  } cases[] = {{0, 100}, {0.5, 550}, {0.999999, 999}, {1, 1000}, {-1, 100}, {2, 1000}};
  for (const auto& c : cases) EXPECT_EQ(BackOff().next(c.chance), Moment(c.wait)) << c.chance;
}

TEST(BackOff, OnlyTenSecondsOfPicturesBringTheFirstLimitBack) {
  BackOff back_off;
  back_off.next(0.5);
  back_off.next(0.5);
  EXPECT_FALSE(back_off.prove(Moment(5000), Moment(14999)));
  EXPECT_EQ(back_off.limit(), Moment(4000));
  EXPECT_TRUE(back_off.prove(Moment(5000), Moment(15000)));
  EXPECT_EQ(back_off.limit(), Moment(1000));
}

}  // namespace
}  // namespace vexa
