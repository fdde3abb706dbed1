// SPDX-License-Identifier: Apache-2.0
#include "node/core/suspicion.h"

#include <gtest/gtest.h>

namespace vexa::node {
namespace {

using namespace std::chrono_literals;

// What remains suspected after `lost` of `nodes` went, one each `apart`.
bool suspects(std::size_t nodes, std::size_t lost, BootTime apart) {
  Suspicion suspicion(6000ms);
  BootTime now = 100000ms;
  for (std::size_t i = 0; i < lost; ++i) {
    now += apart;
    suspicion.vanished(nodes - i, now);
  }
  return suspicion.suspects(now);
}

TEST(Suspicion, MoreThanThirtyOfAHundredNodesTogetherMakeEtcdSuspect) {
  struct Case {
    std::size_t nodes, lost;
    bool suspect;
  };
  for (const Case& row : {Case{20, 6, false},
                          {20, 7, true},
                          {10, 3, false},
                          {10, 4, true},
                          {3, 1, false},
                          {3, 2, true},
                          {2, 1, false},
                          {2, 2, true},
                          {1, 1, false}}) {
    EXPECT_EQ(suspects(row.nodes, row.lost, 10ms), row.suspect) << row.lost << " of " << row.nodes;
  }
}

TEST(Suspicion, NodesThatGoOneAfterTheOtherDoNot) { EXPECT_FALSE(suspects(20, 10, 6001ms)); }

TEST(Suspicion, LastsOneLeaseAfterTheLatestLoss) {
  Suspicion suspicion(6000ms);
  suspicion.vanished(4, 1000ms);
  EXPECT_FALSE(suspicion.suspects(1000ms));
  suspicion.vanished(3, 2000ms);
  EXPECT_TRUE(suspicion.suspects(7999ms));
  EXPECT_FALSE(suspicion.suspects(8000ms));
}

}  // namespace
}  // namespace vexa::node
