// SPDX-License-Identifier: Apache-2.0
// Passes the datagrams of a fuzz input to the packet collector: two bytes of length before each. They are
// placed as in the packet buffer of a running stream, where later ones overwrite earlier ones.
#pragma once

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <map>
#include <utility>
#include <vector>

#include "media/assembly/packet_collector.h"
#include "runtime/base/bytes.h"
#include "transport/wire/packet_ring.h"
#include "transport/wire/rtp_header.h"

namespace vexa_fuzz {

constexpr std::size_t kLongestDatagram = 5000;

/// Each listed datagram is a block of its own, freed when it is overwritten: address checkers see what reads too far or
/// too late.
class DatagramFeed {
 public:
  explicit DatagramFeed(const vexa::PictureRules& rules) : collector_(list_, rules) {
    overwritten_.reserve(vexa::PacketRing::kMostOverwritten);
  }

  /// Places and lists the datagram.
  void place(vexa::Bytes datagram) {
    if (collector_.is_empty()) {
      ring_.restart();
      blocks_.clear();
    }
    const std::uint32_t offset = ring_.next_offset();
    const std::size_t taken = std::min<std::size_t>(datagram.size() * kSpread, vexa::PacketRing::kDatagramRoom);
    overwritten_.clear();
    ring_.written(static_cast<std::uint32_t>(taken), overwritten_);
    collector_.drop_overwritten(overwritten_);
    for (const vexa::PacketRing::Slot& slot : overwritten_) blocks_.erase(slot.offset);
    if (const auto header = vexa::parse_rtp_header(datagram)) list(*header, offset, datagram);
  }

  /// Passes each complete picture to `assemble`, which returns whether it is whole.
  template <typename Assemble>
  void take_pictures(Assemble assemble) {
    now_ += std::chrono::milliseconds(7);
    while (const auto run = collector_.next_picture(now_)) {
      assemble(collector_.packets(*run)) ? collector_.use(*run) : collector_.abandon(*run);
    }
  }

 private:
  static constexpr int kClockRate = 90000;
  // A datagram takes this many times its length in the buffer, so that an input of a few hundred bytes goes round.
  static constexpr std::size_t kSpread = 4096;

  void list(const vexa::RtpHeader& header, std::uint32_t offset, vexa::Bytes datagram) {
    std::vector<unsigned char> block(datagram.begin(), datagram.end());
    SPacketInfo packet;
    packet.data = block.data();
    packet.length = static_cast<std::uint32_t>(block.size());
    packet.marker = header.marker;
    packet.payloadType = header.payload_type;
    packet.sequence = header.sequence;
    packet.timestamp = header.timestamp;
    ring_.keep(packet);
    if (collector_.add(packet, kClockRate, now_)) {
      blocks_[offset] = std::move(block);
    } else {
      ring_.take_back();
    }
  }

  std::map<std::uint32_t, std::vector<unsigned char>> blocks_;  // by their place in the packet buffer
  std::vector<SPacketInfo> list_;
  vexa::PacketCollector collector_;
  vexa::PacketRing ring_;
  std::vector<vexa::PacketRing::Slot> overwritten_;
  std::chrono::steady_clock::time_point now_{};
};

/// Lists every datagram, and hands each picture that becomes complete to `assemble`.
template <typename Assemble>
void feed_datagrams(vexa::Bytes input, const vexa::PictureRules& rules, Assemble assemble) {
  DatagramFeed feed(rules);
  vexa::ByteReader in(input);
  while (in.ok()) {
    const vexa::Bytes datagram = in.take(in.u16() % kLongestDatagram);
    if (!in.ok()) break;
    feed.place(datagram);
    feed.take_pictures(assemble);
  }
}

}  // namespace vexa_fuzz
