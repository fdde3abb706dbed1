#include "transport/wire/packet_ring.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <map>
#include <random>

namespace vexa::test {
namespace {

SPacketInfo numbered(std::uint32_t number) {
  SPacketInfo info;
  info.timestamp = number;
  info.sequence = static_cast<std::uint16_t>(number);
  return info;
}

TEST(PacketRing, DatagramsLieOneAfterTheOther) {
  PacketRing ring;
  std::vector<PacketRing::Slot> overwritten;
  EXPECT_EQ(ring.next_offset(), 0u);
  ring.written(1400, overwritten);
  EXPECT_EQ(ring.next_offset(), 1400u);
  ring.written(0, overwritten);
  EXPECT_EQ(ring.next_offset(), 1400u);
  EXPECT_TRUE(overwritten.empty());
}

TEST(PacketRing, BeginsAgainAt0WhenTheFillExceeds2031616) {
  for (const std::uint32_t last : {0u, 1u}) {
    PacketRing ring;
    std::vector<PacketRing::Slot> overwritten;
    for (int i = 0; i < 31; ++i) {
      ring.next_offset();
      ring.written(65536, overwritten);
    }
    ASSERT_EQ(ring.next_offset(), 2031616u);
    ring.written(last, overwritten);
    EXPECT_EQ(ring.next_offset(), last == 0 ? 2031616u : 0u);
  }
}

TEST(PacketRing, ReachesAsFarAsWasWrittenSinceTheRestart) {
  PacketRing ring;
  std::vector<PacketRing::Slot> overwritten;
  EXPECT_EQ(ring.reach(), 0u);
  for (int i = 0; i < 32; ++i) {
    ring.next_offset();
    ring.written(65536, overwritten);
  }
  EXPECT_EQ(ring.next_offset(), 0u);
  EXPECT_EQ(ring.reach(), PacketRing::kSize) << "a new round takes none of it away";
  ring.restart();
  EXPECT_EQ(ring.reach(), 0u);
  ring.next_offset();
  ring.written(100, overwritten);
  EXPECT_EQ(ring.reach(), 100u);
}

TEST(PacketRing, RestartedItBeginsAt0AndKnowsNoPacket) {
  PacketRing ring;
  std::vector<PacketRing::Slot> overwritten;
  ring.next_offset();
  ring.written(1400, overwritten);
  ring.keep(numbered(1));
  ring.restart();
  EXPECT_EQ(ring.next_offset(), 0u);
  for (int i = 0; i < 70; ++i) {
    ring.next_offset();
    ring.written(65536, overwritten);
  }
  EXPECT_TRUE(overwritten.empty());
}

TEST(PacketRing, APacketTakenBackIsNotNamed) {
  PacketRing ring;
  std::vector<PacketRing::Slot> overwritten;
  for (const std::uint32_t number : {1u, 2u, 3u}) {
    ring.next_offset();
    ring.written(20, overwritten);
    ring.keep(numbered(number));
    if (number == 2) ring.take_back();
  }
  for (int i = 0; i < 32; ++i) {
    ring.next_offset();
    ring.written(65536, overwritten);
  }
  ASSERT_EQ(overwritten.size(), 2u);
  EXPECT_EQ(overwritten[0].timestamp, 1u);
  EXPECT_EQ(overwritten[1].timestamp, 3u);
}

TEST(PacketRing, OneDatagramOverwritesNoMoreThanItsOwnerMakesRoomFor) {
  PacketRing ring;
  std::vector<PacketRing::Slot> overwritten;
  for (std::uint32_t number = 0, round = 0; round < 2; ++number) {
    const std::uint32_t before = ring.next_offset();
    ring.written(12, overwritten);
    ring.keep(numbered(number));
    if (ring.next_offset() < before) ++round;
  }
  overwritten.clear();
  ring.next_offset();
  ring.written(PacketRing::kDatagramRoom, overwritten);
  EXPECT_GT(overwritten.size(), PacketRing::kMostOverwritten - 10);
  EXPECT_LE(overwritten.size(), PacketRing::kMostOverwritten);
}

TEST(PacketRing, NamesExactlyTheKeptPacketsThatItOverwrites) {
  PacketRing ring;
  std::mt19937 random(3);
  std::map<std::uint32_t, std::pair<std::uint32_t, std::uint32_t>> model;  // offset: end, number
  std::vector<PacketRing::Slot> overwritten;
  for (std::uint32_t number = 0; number < 20000; ++number) {
    const std::uint32_t offset = ring.next_offset();
    const std::uint32_t length = random() % 5 == 0 ? static_cast<std::uint32_t>(random() % 65537) : 1412;
    ASSERT_LE(offset + length, PacketRing::kSize);
    overwritten.clear();
    ring.written(length, overwritten);
    std::vector<std::uint32_t> named;
    for (const PacketRing::Slot& slot : overwritten) named.push_back(slot.timestamp);
    std::vector<std::uint32_t> wanted;
    for (auto entry = model.begin(); entry != model.end();) {
      const bool overlaps = entry->first < offset + length && offset < entry->second.first;
      if (overlaps) wanted.push_back(entry->second.second);
      entry = overlaps ? model.erase(entry) : std::next(entry);
    }
    ASSERT_EQ(named, wanted) << "datagram " << number;
    if (length > 12 && random() % 3 != 0) {
      ring.keep(numbered(number));
      model[offset] = {offset + length, number};
    }
  }
}

}  // namespace
}  // namespace vexa::test
