// SPDX-License-Identifier: Apache-2.0
// How many sessions connect at once.
#include "session/core/admission.h"

#include <gtest/gtest.h>

namespace vexa {
namespace {

TEST(Admission, AdmitsUpToTheBoundAndThenInTurn) {
  Admission admission(2);
  EXPECT_TRUE(admission.enter(1));
  EXPECT_TRUE(admission.enter(2));
  EXPECT_FALSE(admission.enter(3));
  EXPECT_FALSE(admission.enter(4));
  EXPECT_EQ(admission.admit_next(), 0U);
  admission.leave(1);
  EXPECT_FALSE(admission.enter(4)) << "3 came first";
  EXPECT_EQ(admission.admit_next(), 3U);
  EXPECT_EQ(admission.inside(), 2U);
  EXPECT_EQ(admission.waiting(), 1U);
}

TEST(Admission, ASessionThatAsksTwiceStandsInTheQueueOnce) {
  Admission admission(1);
  EXPECT_TRUE(admission.enter(1));
  EXPECT_TRUE(admission.enter(1)) << "it is inside";
  EXPECT_FALSE(admission.enter(2));
  EXPECT_FALSE(admission.enter(2));
  EXPECT_EQ(admission.waiting(), 1U);
}

TEST(Admission, ASessionThatLeavesTheQueueIsPassedOver) {
  Admission admission(1);
  admission.enter(1);
  admission.enter(2);
  admission.enter(3);
  admission.leave(2);
  admission.leave(1);
  EXPECT_EQ(admission.admit_next(), 3U);
  EXPECT_EQ(admission.waiting(), 0U);
}

}  // namespace
}  // namespace vexa
