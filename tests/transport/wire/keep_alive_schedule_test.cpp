#include "transport/wire/keep_alive_schedule.h"

#include <gtest/gtest.h>

#include <climits>

namespace vexa {
namespace {

TEST(KeepAliveInterval, FollowsTheSessionsTimeout) {
  const struct {
    int timeout, interval;
  } cases[] = {{120, 30}, {61, 30}, {60, 30}, {59, 29}, {10, 5},       {4, 2},      {3, 1},
               {2, 1},    {1, 1},   {0, 1},   {-5, 1},  {INT_MAX, 30}, {INT_MIN, 1}};
  for (const auto& c : cases) EXPECT_EQ(keep_alive_interval(c.timeout), c.interval) << c.timeout;
}

TEST(KeepAliveDue, IsDueFirstAndThenAfterTheInterval) {
  EXPECT_TRUE(keep_alive_due(1000, 0, 30));
  EXPECT_FALSE(keep_alive_due(1000, 1000, 30));
  EXPECT_FALSE(keep_alive_due(1029, 1000, 30));
  EXPECT_TRUE(keep_alive_due(1030, 1000, 30));
}

TEST(KeepAliveDue, IsDueAtOnceAfterATimeInTheFuture) { EXPECT_TRUE(keep_alive_due(1000, 1001, 30)); }

}  // namespace
}  // namespace vexa
