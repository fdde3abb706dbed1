// SPDX-License-Identifier: Apache-2.0
// The order in which received RTP packets are kept.
#pragma once

#include <algorithm>
#include <cstdint>
#include <vector>

#include "vexa/video_info.h"

namespace vexa {

/// The rank of `timestamp` in the order of the list.
// Kept: small timestamps are lifted by a constant, so that 5 (taken as 10000005) comes after 10000004 and before
// 9000000.
constexpr std::uint32_t order_timestamp(std::uint32_t timestamp) {
  constexpr std::uint32_t kLift = 10'000'000;
  return timestamp < kLift ? timestamp + kLift : timestamp;
}

/// `sequence` is ahead of `other` by 1 to 32766, across the wrap at 65535.
constexpr bool sequence_is_ahead(std::uint16_t sequence, std::uint16_t other) {
  const auto difference = static_cast<std::uint16_t>(sequence - other);
  return difference >= 1 && difference <= 32766;
}
static_assert(sequence_is_ahead(0, 65535) && !sequence_is_ahead(65535, 0));
static_assert(sequence_is_ahead(32766, 0) && !sequence_is_ahead(32767, 0) && !sequence_is_ahead(7, 7));

/// `timestamp` is later than `other`, across the wrap at 2^32.
constexpr bool timestamp_is_after(std::uint32_t timestamp, std::uint32_t other) {
  return static_cast<std::int32_t>(timestamp - other) > 0;
}
static_assert(timestamp_is_after(0, 0xffffffff) && !timestamp_is_after(0xffffffff, 0));

/// `a` comes before `b` in the list: by timestamp, then by sequence. A search key that is marked keyOnly comes after
/// every packet of its timestamp; equal packets are not ordered, and so keep their arrival order.
inline bool ordered_before(const SPacketInfo& a, const SPacketInfo& b) {
  const std::uint32_t time_a = order_timestamp(a.timestamp);
  const std::uint32_t time_b = order_timestamp(b.timestamp);
  if (time_a != time_b) return time_a < time_b;
  if (a.keyOnly || b.keyOnly) return !a.keyOnly;
  return a.sequence != b.sequence && !sequence_is_ahead(a.sequence, b.sequence);
}

/// Where `packet` belongs in the ordered list: after all that it does not precede. Compares with the newest packet
/// first, so that packets in order cost the same however many are listed.
inline std::vector<SPacketInfo>::iterator place_of(std::vector<SPacketInfo>& packets, const SPacketInfo& packet) {
  if (packets.empty() || !ordered_before(packet, packets.back())) return packets.end();
  return std::upper_bound(packets.begin(), packets.end(), packet, ordered_before);
}

}  // namespace vexa
