// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/rtp/packet_impairment.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <bit>
#include <map>
#include <vector>

namespace vexa::camera {
namespace {

using std::chrono::milliseconds;

constexpr std::array<std::uint8_t, 4> kPayload{0x41, 0x9A, 0x55, 0xAA};
constexpr std::size_t kMany = 20000;

// The nth packet of a stream of one-packet pictures, 1 ms apart.
Outgoing packet_of(std::size_t n) {
  Outgoing packet;
  packet.header = {0x80, 0xE0, static_cast<std::uint8_t>(n >> 8U), static_cast<std::uint8_t>(n)};
  packet.payload = kPayload;
  packet.record.picture = n;
  packet.read_header();
  return packet;
}

std::vector<Outgoing> through(const PacketFaults& faults, std::size_t packets, std::uint64_t seed = 1) {
  PacketImpairment impairment(faults, seed);
  std::vector<Outgoing> leaving;
  for (std::size_t n = 0; n < packets; ++n) {
    const auto now = milliseconds(n);
    impairment.release_due(now, leaving);
    impairment.offer(packet_of(n), now, leaving);
  }
  impairment.release_held(leaving);
  while (const auto due = impairment.next_due()) impairment.release_due(*due, leaving);
  return leaving;
}

std::vector<std::uint64_t> pictures_of(const std::vector<Outgoing>& packets) {
  std::vector<std::uint64_t> pictures;
  for (const Outgoing& packet : packets) pictures.push_back(packet.record.picture);
  return pictures;
}

template <typename Test>
std::size_t count_if(const std::vector<Outgoing>& packets, Test test) {
  return static_cast<std::size_t>(
      std::count_if(packets.begin(), packets.end(), [&](const Outgoing& packet) { return test(packet.record); }));
}

PacketFaults everything() {
  PacketFaults faults;
  faults.loss = 0.02;
  faults.burst_loss = 0.001;
  faults.reorder = 0.05;
  faults.duplicate = 0.02;
  faults.duplicate_distance = 5;
  faults.delay = 0.01;
  faults.corrupt_payload = 0.01;
  faults.corrupt_header = 0.01;
  faults.missing_marker = 0.01;
  return faults;
}

TEST(PacketImpairment, WithoutFaultsEveryPacketLeavesInOrder) {
  const std::vector<Outgoing> packets = through({}, 100);
  ASSERT_EQ(packets.size(), 100U);
  for (std::size_t n = 0; n < 100; ++n) {
    EXPECT_EQ(packets[n].record.picture, n);
    EXPECT_FALSE(packets[n].record.lost);
    EXPECT_TRUE(packets[n].changed_payload.empty());
  }
}

TEST(PacketImpairment, TheSameSeedGivesTheSameFaults) {
  const auto fingerprint = [](std::uint64_t seed) {
    std::vector<std::vector<std::uint8_t>> bytes;
    for (const Outgoing& packet : through(everything(), 2000, seed)) {
      auto& entry = bytes.emplace_back(packet.header.begin(), packet.header.end());
      const auto payload = packet.payload_to_send();
      entry.insert(entry.end(), payload.begin(), payload.end());
      entry.push_back(packet.record.lost ? 1 : 0);
    }
    return bytes;
  };
  EXPECT_EQ(fingerprint(1), fingerprint(1));
  EXPECT_NE(fingerprint(1), fingerprint(2));
}

TEST(PacketImpairment, SeededDrawsAreTheSameOnEveryWordSize) {
  PacketFaults faults;
  faults.loss = 0.1;
  std::vector<std::uint64_t> lost;
  for (const Outgoing& packet : through(faults, 60, 1)) {
    if (packet.record.lost) lost.push_back(packet.record.picture);
  }
  EXPECT_EQ(lost, (std::vector<std::uint64_t>{3, 7, 10, 27, 38, 43, 54, 57, 59}));
}

TEST(PacketImpairment, LossTakesItsShareAndLeavesTheRestInOrder) {
  PacketFaults faults;
  faults.loss = 0.1;
  const std::vector<Outgoing> packets = through(faults, kMany);
  EXPECT_EQ(packets.size(), kMany);
  const std::size_t lost = count_if(packets, [](const SentPacket& p) { return p.lost; });
  EXPECT_GT(lost, kMany / 10 - 300);
  EXPECT_LT(lost, kMany / 10 + 300);
  const std::vector<std::uint64_t> order = pictures_of(packets);
  EXPECT_TRUE(std::is_sorted(order.begin(), order.end()));
}

TEST(PacketImpairment, BurstsLoseTheirLengthOfPacketsInARow) {
  PacketFaults faults;
  faults.burst_loss = 0.002;
  faults.burst_length = 5;
  std::size_t run = 0;
  std::size_t bursts = 0;
  for (const Outgoing& packet : through(faults, kMany)) {
    if (packet.record.lost) {
      ++run;
      continue;
    }
    EXPECT_EQ(run % 5, 0U);  // two bursts may touch
    bursts += run / 5;
    run = 0;
  }
  EXPECT_GT(bursts, 10U);
}

TEST(PacketImpairment, ReorderedPacketsComeAfterAtMostTheDistanceOfLaterOnes) {
  PacketFaults faults;
  faults.reorder = 0.05;
  faults.reorder_distance = 20;
  const std::vector<Outgoing> packets = through(faults, kMany);
  ASSERT_EQ(packets.size(), kMany);
  std::map<std::size_t, std::size_t> distances;
  for (std::size_t place = 0; place < packets.size(); ++place) {
    if (!packets[place].record.reordered) continue;
    const std::uint64_t own = packets[place].record.picture;
    std::uint64_t newest = own;
    for (std::size_t before = 0; before < place; ++before) {
      newest = std::max(newest, packets[before].record.picture);
    }
    ++distances[static_cast<std::size_t>(newest - own)];
  }
  EXPECT_EQ(distances.rbegin()->first, 20U);
  // Behind a packet that is itself held back it may leave in its old order; that is rare.
  EXPECT_LT(distances[0], kMany / 1000);
  EXPECT_GT(distances[1], 10U);
}

TEST(PacketImpairment, DuplicatesFollowAtOnceOrAfterLaterPackets) {
  PacketFaults faults;
  faults.duplicate = 0.01;
  std::vector<Outgoing> packets = through(faults, kMany);
  std::size_t twice = 0;
  for (std::size_t i = 1; i < packets.size(); ++i) {
    if (!packets[i].record.duplicate) continue;
    ++twice;
    EXPECT_EQ(packets[i].record.picture, packets[i - 1].record.picture);
    EXPECT_FALSE(packets[i - 1].record.duplicate);
  }
  EXPECT_GT(twice, 100U);
  EXPECT_EQ(packets.size(), kMany + twice);
  faults.duplicate_distance = 10;
  packets = through(faults, kMany);
  const std::vector<std::uint64_t> order = pictures_of(packets);
  EXPECT_FALSE(std::is_sorted(order.begin(), order.end()));
  for (std::size_t i = 0; i < packets.size(); ++i) {
    if (!packets[i].record.duplicate) continue;
    const auto begin = packets.begin() + static_cast<std::ptrdiff_t>(i > 12 ? i - 12 : 0);
    const bool near = std::any_of(begin, packets.begin() + static_cast<std::ptrdiff_t>(i), [&](const Outgoing& p) {
      return p.record.picture == packets[i].record.picture && !p.record.duplicate;
    });
    EXPECT_TRUE(near) << i;
  }
}

TEST(PacketImpairment, DelayedPacketsLeaveWhenTheirTimeHasCome) {
  PacketFaults faults;
  faults.delay = 0.01;
  faults.delay_time = milliseconds(7);
  const std::vector<Outgoing> packets = through(faults, kMany);
  ASSERT_EQ(packets.size(), kMany);
  std::size_t delayed = 0;
  for (std::size_t i = 0; i + 1 < packets.size(); ++i) {
    if (!packets[i].record.delayed) continue;
    ++delayed;
    // Packets are 1 ms apart, so it goes right before the one seven later, or the next when that is delayed itself.
    const std::uint64_t gap = packets[i + 1].record.picture - packets[i].record.picture;
    EXPECT_TRUE(gap == 7 || packets[i + 1].record.delayed || gap == 8) << i << " " << gap;
  }
  EXPECT_GT(delayed, 100U);
}

TEST(PacketImpairment, CorruptionFlipsTheStatedBitsOfPayloadOrHeader) {
  PacketFaults faults;
  faults.corrupt_payload = 1;
  faults.corrupt_bits = 1;
  for (const Outgoing& packet : through(faults, 100)) {
    int flipped = 0;
    for (std::size_t i = 0; i < kPayload.size(); ++i) {
      flipped += std::popcount(static_cast<unsigned>(packet.payload_to_send()[i] ^ kPayload[i]));
    }
    EXPECT_EQ(flipped, 1);
    EXPECT_TRUE(packet.record.corrupted_payload);
  }
  faults = {};
  faults.corrupt_header = 1;
  for (const Outgoing& packet : through(faults, 100)) {
    const Outgoing clean = packet_of(static_cast<std::size_t>(packet.record.picture));
    int flipped = 0;
    for (std::size_t i = 0; i < clean.header.size(); ++i) {
      flipped += std::popcount(static_cast<unsigned>(packet.header[i] ^ clean.header[i]));
    }
    EXPECT_EQ(flipped, 1);
    EXPECT_EQ(packet.record.sequence, packet.header[2] << 8U | packet.header[3]);
    EXPECT_EQ(packet.record.marker, (packet.header[1] & 0x80U) != 0);
  }
}

TEST(PacketImpairment, AMissingMarkerIsClearedInTheHeader) {
  PacketFaults faults;
  faults.missing_marker = 1;
  for (const Outgoing& packet : through(faults, 10)) {
    EXPECT_EQ(packet.header[1], 0x60);
    EXPECT_FALSE(packet.record.marker);
    EXPECT_TRUE(packet.record.marker_removed);
  }
}

TEST(PacketImpairment, FaultsAffectOnlyPicturesOfTheirWindow) {
  PacketFaults faults;
  faults.loss = 1;
  faults.first_picture = 10;
  faults.last_picture = 19;
  for (const Outgoing& packet : through(faults, 30)) {
    const std::uint64_t picture = packet.record.picture;
    EXPECT_EQ(packet.record.lost, picture >= 10 && picture <= 19) << picture;
  }
}

TEST(PacketImpairment, NothingIsKeptBackForever) {
  PacketFaults faults = everything();
  faults.loss = 0;
  faults.burst_loss = 0;
  const std::vector<Outgoing> packets = through(faults, kMany);
  EXPECT_EQ(count_if(packets, [](const SentPacket& p) { return !p.duplicate; }), kMany);
}

}  // namespace
}  // namespace vexa::camera
