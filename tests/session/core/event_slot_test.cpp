// SPDX-License-Identifier: Apache-2.0
// Events for a host that may be slow.
#include "session/core/event_slot.h"

#include <gtest/gtest.h>

namespace vexa {
namespace {

SessionStatus status_of(SessionState state) {
  SessionStatus status;
  status.state = state;
  return status;
}

TEST(EventSlot, EventsAreNumberedFromOne) {
  EventSlot slot;
  EXPECT_FALSE(slot.take());
  slot.put(status_of(SessionState::kConnecting));
  EXPECT_EQ(slot.take()->event, 1U);
  EXPECT_FALSE(slot.take());
  slot.put(status_of(SessionState::kLive));
  EXPECT_EQ(slot.take()->event, 2U);
}

TEST(EventSlot, ASlowHostGetsTheLatestAndHowManyItMissed) {
  EventSlot slot;
  for (int i = 0; i < 5; ++i) slot.put(status_of(SessionState::kWaiting));
  slot.put(status_of(SessionState::kLive));
  const auto taken = slot.take();
  ASSERT_TRUE(taken);
  EXPECT_EQ(taken->state, SessionState::kLive);
  EXPECT_EQ(taken->event, 6U);
  EXPECT_EQ(taken->missed, 5U);
  EXPECT_EQ(slot.missed(), 5U);
  slot.put(status_of(SessionState::kStalled));
  EXPECT_EQ(slot.take()->missed, 0U);
}

TEST(EventSlot, TheStateAskedForIsTheLatestEventTakenOrNot) {
  EventSlot slot;
  EXPECT_EQ(slot.latest().state, SessionState::kIdle);
  EXPECT_EQ(slot.latest().event, 0U);
  slot.put(status_of(SessionState::kLive));
  EXPECT_EQ(slot.latest().event, 1U);
  ASSERT_TRUE(slot.take());
  EXPECT_EQ(slot.latest().event, 1U);
}

}  // namespace
}  // namespace vexa
