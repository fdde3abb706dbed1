#include "transport/wire/packet_order.h"

#include <algorithm>

namespace vexa {

bool ordered_before(const SPacketInfo& a, const SPacketInfo& b) {
  const std::uint32_t time_a = order_timestamp(a.timestamp);
  const std::uint32_t time_b = order_timestamp(b.timestamp);
  if (time_a != time_b) return time_a < time_b;
  if (a.keyOnly || b.keyOnly) return !a.keyOnly;
  return a.sequence != b.sequence && !sequence_is_ahead(a.sequence, b.sequence);
}

std::vector<SPacketInfo>::iterator place_of(std::vector<SPacketInfo>& packets, const SPacketInfo& packet) {
  if (packets.empty() || !ordered_before(packet, packets.back())) return packets.end();
  return std::upper_bound(packets.begin(), packets.end(), packet, ordered_before);
}

}  // namespace vexa
