// SPDX-License-Identifier: Apache-2.0
#include "node/segments/retention.h"

#include <gtest/gtest.h>

namespace vexa::node {
namespace {

using namespace std::chrono_literals;
using Indices = std::vector<std::size_t>;

// In no order of time.
const std::vector<StoredSegment> kSegments = {{3000ms, 10}, {1000ms, 20}, {4000ms, 30, true}, {2000ms, 40}};

TEST(Retention, WithoutRulesEverythingStays) { EXPECT_EQ(segments_to_remove(kSegments, {}, 100000ms), Indices{}); }

TEST(Retention, WhatIsOlderThanTheAgeGoes) {
  EXPECT_EQ(segments_to_remove(kSegments, {.age = 10s}, 12000ms), Indices{1});
  EXPECT_EQ(segments_to_remove(kSegments, {.age = 10s}, 12001ms), (Indices{1, 3}));
}

TEST(Retention, AboveTheHighMarkTheOldestGoDownToTheLowOne) {
  EXPECT_EQ(segments_to_remove(kSegments, {.high_bytes = 100, .low_bytes = 80}, 0ms), Indices{});
  EXPECT_EQ(segments_to_remove(kSegments, {.high_bytes = 99, .low_bytes = 80}, 0ms), Indices{1});
  EXPECT_EQ(segments_to_remove(kSegments, {.high_bytes = 99, .low_bytes = 79}, 0ms), (Indices{1, 3}));
}

TEST(Retention, AnOpenSegmentCountsAndStays) {
  EXPECT_EQ(segments_to_remove(kSegments, {.high_bytes = 1, .low_bytes = 0}, 0ms), (Indices{1, 3, 0}));
  EXPECT_EQ(segments_to_remove(kSegments, {.age = 0s}, 9000ms), (Indices{1, 3, 0}));
}

}  // namespace
}  // namespace vexa::node
