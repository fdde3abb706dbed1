// SPDX-License-Identifier: Apache-2.0
#include "transport/wire/packet_order.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <random>

namespace vexa::test {
namespace {

SPacketInfo packet(std::uint32_t timestamp, std::uint16_t sequence) {
  SPacketInfo info;
  info.timestamp = timestamp;
  info.sequence = sequence;
  return info;
}

struct Pair {
  const char* what;
  SPacketInfo first;
  SPacketInfo second;
};

TEST(PacketOrder, PutsTheFirstOfEachPairBeforeTheSecond) {
  const Pair pairs[] = {
      {"smaller timestamp", packet(20000000, 9), packet(20000001, 1)},
      {"sequence ahead by 1", packet(20000000, 7), packet(20000000, 8)},
      {"sequence ahead by 32766", packet(20000000, 1), packet(20000000, 32767)},
      {"sequence across its wrap", packet(20000000, 65535), packet(20000000, 0)},
      {"largest timestamp last", packet(9999999, 0), packet(4294967295, 0)},
  };
  for (const Pair& pair : pairs) {
    EXPECT_TRUE(ordered_before(pair.first, pair.second)) << pair.what;
    EXPECT_FALSE(ordered_before(pair.second, pair.first)) << pair.what;
  }
}

TEST(PacketOrder, LiftsTimestampsBelow10000000ByThatMuch) {
  EXPECT_EQ(order_timestamp(0), 10000000u);
  EXPECT_EQ(order_timestamp(9999999), 19999999u);
  EXPECT_EQ(order_timestamp(10000000), 10000000u);
  EXPECT_EQ(order_timestamp(10000001), 10000001u);
  EXPECT_EQ(order_timestamp(4294967295), 4294967295u);
}

TEST(PacketOrder, Timestamp5ComesAfter10000004AndBefore9000000) {
  EXPECT_TRUE(ordered_before(packet(10000004, 0), packet(5, 0)));
  EXPECT_TRUE(ordered_before(packet(5, 0), packet(9000000, 0)));
}

TEST(PacketOrder, AnyOtherSequenceDifferencePutsThePacketBefore) {
  for (const int difference : {32767, 32768, 40000, 65535}) {
    EXPECT_TRUE(ordered_before(packet(20000000, static_cast<std::uint16_t>(difference)), packet(20000000, 0)))
        << difference;
  }
}

TEST(PacketOrder, EqualPacketsAreNotOrdered) { EXPECT_FALSE(ordered_before(packet(20000000, 3), packet(20000000, 3))); }

TEST(PacketOrder, AKeyOnlySearchKeyComesAfterEveryPacketOfItsTimestamp) {
  SPacketInfo key = packet(20000000, 0);
  key.keyOnly = true;
  for (const int number : {0, 1, 32767, 65535}) {
    const auto sequence = static_cast<std::uint16_t>(number);
    EXPECT_TRUE(ordered_before(packet(20000000, sequence), key)) << sequence;
    EXPECT_FALSE(ordered_before(key, packet(20000000, sequence))) << sequence;
  }
  EXPECT_TRUE(ordered_before(key, packet(20000001, 0)));
}

TEST(PacketOrder, ShuffledPacketsFindTheirPlaces) {
  std::vector<SPacketInfo> wanted;
  for (std::uint32_t picture = 0; picture < 20; ++picture) {
    for (std::uint16_t i = 0; i < 10; ++i) {
      wanted.push_back(packet(30000000 + picture * 3600, static_cast<std::uint16_t>(65480 + picture * 10 + i)));
    }
  }
  std::vector<SPacketInfo> shuffled = wanted;
  std::shuffle(shuffled.begin(), shuffled.end(), std::mt19937(1));
  std::vector<SPacketInfo> list;
  for (const SPacketInfo& info : shuffled) list.insert(place_of(list, info), info);
  ASSERT_EQ(list.size(), wanted.size());
  for (std::size_t i = 0; i < list.size(); ++i) EXPECT_EQ(list[i].sequence, wanted[i].sequence) << i;
}

TEST(PacketOrder, ANewPacketComesAfterItsEqual) {
  std::vector<SPacketInfo> list = {packet(20000000, 1), packet(20000000, 2), packet(20000000, 3)};
  EXPECT_EQ(place_of(list, packet(20000000, 2)) - list.begin(), 2);
  EXPECT_EQ(place_of(list, packet(20000000, 3)) - list.begin(), 3);
}

TEST(PacketOrder, RandomPacketsNeverLeaveTheList) {
  std::mt19937 random(7);
  std::vector<SPacketInfo> list;
  for (int i = 0; i < 3000; ++i) {
    const SPacketInfo info =
        packet(static_cast<std::uint32_t>(random() % 4) * 5000000 + static_cast<std::uint32_t>(random() % 3),
               static_cast<std::uint16_t>(random()));
    const auto place = place_of(list, info);
    ASSERT_TRUE(place >= list.begin() && place <= list.end());
    list.insert(place, info);
  }
  EXPECT_TRUE(std::is_sorted(list.begin(), list.end(), [](const SPacketInfo& a, const SPacketInfo& b) {
    return order_timestamp(a.timestamp) < order_timestamp(b.timestamp);
  }));
}

}  // namespace
}  // namespace vexa::test
