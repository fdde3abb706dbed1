// The equations that hold in every snapshot.
#pragma once

#include <gtest/gtest.h>

#include "vexa/statistics.h"

namespace vexa_test {

inline vexa::StreamStatistics statistics_of(CVexaCommon& driver) {
  vexa::StreamStatistics statistics;
  vexa::GetStreamStatistics(driver, statistics);
  return statistics;
}

inline void expect_equations(const vexa::StreamStatistics& s) {
  EXPECT_EQ(s.packetsReceived, s.packetsUsed + s.packetsDuplicated + s.packetsDiscarded + s.packetsHeld);
  EXPECT_EQ(s.framesBegun, s.framesHandedOut + s.framesDropped + s.framesHeldInAssembly + s.framesHeldInQueue);
  EXPECT_EQ(s.packetsExpected, s.packetsReceivedOnce + s.packetsMissing + s.packetsMissingInCamera);
  EXPECT_EQ(s.packetsDiscarded, s.packetsDiscardedLate + s.packetsDiscardedIncomplete + s.packetsDiscardedMalformed +
                                    s.packetsDiscardedNotRtp + s.packetsDiscardedForeignSource +
                                    s.packetsDiscardedForeignSsrc + s.packetsDiscardedWrongPayloadType +
                                    s.packetsDiscardedTruncated + s.packetsDiscardedOverwritten +
                                    s.packetsDiscardedAfterStop + s.packetsDiscardedNoMemory);
  EXPECT_EQ(s.framesDropped, s.framesDroppedIncomplete + s.framesDroppedDamaged + s.framesDroppedWithoutKey +
                                 s.framesDroppedTooLarge + s.framesDroppedQueue + s.framesDroppedAfterStop +
                                 s.framesDroppedNoMemory);
}

inline void expect_not_fallen(const vexa::StreamStatistics& before, const vexa::StreamStatistics& after) {
  EXPECT_LE(before.packetsReceived, after.packetsReceived);
  EXPECT_LE(before.packetsUsed, after.packetsUsed);
  EXPECT_LE(before.packetsDuplicated, after.packetsDuplicated);
  EXPECT_LE(before.packetsDiscarded, after.packetsDiscarded);
  EXPECT_LE(before.packetsExpected, after.packetsExpected);
  EXPECT_LE(before.packetsLate, after.packetsLate);
  EXPECT_LE(before.framesBegun, after.framesBegun);
  EXPECT_LE(before.framesAssembled, after.framesAssembled);
  EXPECT_LE(before.framesHandedOut, after.framesHandedOut);
  EXPECT_LE(before.framesDropped, after.framesDropped);
  EXPECT_LE(before.keyFrames, after.keyFrames);
}

}  // namespace vexa_test
