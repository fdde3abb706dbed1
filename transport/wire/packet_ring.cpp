#include "transport/wire/packet_ring.h"

#include <algorithm>

namespace vexa {

std::uint32_t PacketRing::next_offset() {
  if (fill_ <= kSize - kDatagramRoom) return fill_;
  // What earlier rounds left intact comes after all of this round.
  this_round_.insert(this_round_.end(), earlier_rounds_.begin() + static_cast<std::ptrdiff_t>(oldest_),
                     earlier_rounds_.end());
  earlier_rounds_.swap(this_round_);
  this_round_.clear();
  oldest_ = 0;
  fill_ = 0;
  return fill_;
}

void PacketRing::written(std::uint32_t length, std::vector<Slot>& overwritten) {
  last_offset_ = fill_;
  fill_ += length;
  reach_ = std::max(reach_, fill_);
  while (oldest_ < earlier_rounds_.size() && earlier_rounds_[oldest_].offset < fill_) {
    overwritten.push_back(earlier_rounds_[oldest_++]);
  }
}

void PacketRing::restart() {
  this_round_.clear();
  earlier_rounds_.clear();
  oldest_ = 0;
  fill_ = 0;
  reach_ = 0;
}

void PacketRing::keep(const SPacketInfo& packet) {
  this_round_.push_back({last_offset_, packet.timestamp, packet.sequence});
}

}  // namespace vexa
