// SPDX-License-Identifier: Apache-2.0
#include "host/recording/lost_pictures.h"

#include <gtest/gtest.h>

namespace vexa::host {
namespace {

StreamStatistics counted() {
  StreamStatistics statistics;
  statistics.framesBegun = 54;
  statistics.framesDroppedWithoutKey = 14;
  statistics.framesDroppedIncomplete = 1;
  statistics.packetsMissing = 2;
  statistics.packetsMissingInCamera = 1;
  return statistics;
}

TEST(LostPictures, AreCountedOfHowManyAndWhy) {
  const LostPictures lost(counted());
  EXPECT_TRUE(lost.any());
  EXPECT_EQ(lost.text(),
            "15 of 54 pictures were lost: 1 some packets of which never came, 14 without the key picture before them; "
            "3 packets never came");
}

TEST(LostPictures, OfAStreamWithoutLossesAreNone) {
  StreamStatistics statistics;
  statistics.framesBegun = 54;
  const LostPictures lost(statistics);
  EXPECT_FALSE(lost.any());
  EXPECT_EQ(lost.text(), "0 of 54 pictures were lost");
}

TEST(LostPictures, AreThoseSinceAnEarlierCount) {
  StreamStatistics later = counted();
  later.framesBegun = 60;
  later.framesDroppedQueue = 2;
  later.packetsMissing = 1;  // one was late
  const LostPictures since = LostPictures(later).since(LostPictures(counted()));
  EXPECT_EQ(since.text(), "2 of 6 pictures were lost: 2 because this program was too slow");
}

TEST(LostPictures, OfADriverThatBeganAnewAreAllItHas) {
  StreamStatistics anew;
  anew.framesBegun = 10;
  anew.framesDroppedDamaged = 1;
  EXPECT_EQ(LostPictures(anew).since(LostPictures(counted())).text(), "1 of 10 pictures were lost: 1 damaged");
}

TEST(LostPictures, HaveARowForEachReasonOfTheDriver) {
  StreamStatistics statistics;
  std::uint64_t sum = 0;
  std::uint64_t next = 1;
  for (const auto& reason : LostPictures::reasons()) sum += statistics.*reason.count = next++;
  EXPECT_EQ(LostPictures(statistics).lost(), sum);
}

}  // namespace
}  // namespace vexa::host
