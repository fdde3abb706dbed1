// The places of datagrams in the packet buffer, and which of them a new one overwrites.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "vexa/video_info.h"

namespace vexa {

/// Places datagrams one after the other in a buffer of kSize bytes, beginning again at its start when less than a
/// whole datagram's room is left. Knows the place of each kept packet, in the order in which they will be overwritten,
/// so that a datagram costs the same however many are kept.
class PacketRing {
 public:
  static constexpr std::uint32_t kSize = 2097152;
  static constexpr std::uint32_t kDatagramRoom = 65536;
  /// What one datagram can overwrite at most, where a kept packet has 12 bytes or more.
  static constexpr std::size_t kMostOverwritten = kDatagramRoom / 12 + 1;

  /// What is remembered of a kept packet.
  struct Slot {
    std::uint32_t offset;
    std::uint32_t timestamp;
    std::uint16_t sequence;
  };

  /// Where the next datagram goes; kDatagramRoom bytes are free there.
  std::uint32_t next_offset();

  /// A datagram of `length` bytes was read to next_offset(): appends the slots that it overwrote to `overwritten`.
  void written(std::uint32_t length, std::vector<Slot>& overwritten);

  /// The datagram written last is to be listed, as `packet`.
  void keep(const SPacketInfo& packet);

  /// The packet kept last is not listed after all.
  void take_back() { this_round_.pop_back(); }

  /// No packet is kept any more: begins again at the start, whose memory is still in the cache.
  void restart();

  /// The bytes at the buffer's start that were written since it last began there anew.
  std::uint32_t reach() const { return reach_; }

 private:
  std::uint32_t fill_ = 0;
  std::uint32_t reach_ = 0;
  std::uint32_t last_offset_ = 0;
  std::vector<Slot> this_round_;      // ascending by offset, below fill_
  std::vector<Slot> earlier_rounds_;  // ascending by offset; those from oldest_ on are at or after fill_
  std::size_t oldest_ = 0;
};

}  // namespace vexa
