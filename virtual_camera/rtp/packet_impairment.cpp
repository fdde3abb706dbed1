// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/rtp/packet_impairment.h"

#include <utility>

namespace vexa::camera {

PacketImpairment::PacketImpairment(PacketFaults faults, std::uint64_t seed)
    : faults_(std::move(faults)), random_(seed) {}

void PacketImpairment::change(PacketFaults faults) {
  faults_ = std::move(faults);
  burst_left_ = 0;
}

// Written out, because the standard distributions may draw differently from one word size to another.
bool PacketImpairment::hit(double probability) {
  if (probability <= 0) return false;
  constexpr double kScale = 1.0 / 9007199254740992.0;  // 2^-53
  return static_cast<double>(random_() >> 11U) * kScale < probability;
}

std::size_t PacketImpairment::up_to(std::size_t most) {
  return static_cast<std::size_t>(random_() % (std::uint64_t{most} + 1));
}

bool PacketImpairment::lost() {
  if (burst_left_ > 0) {
    --burst_left_;
    return true;
  }
  if (faults_.burst_length > 0 && hit(faults_.burst_loss)) {
    burst_left_ = faults_.burst_length - 1;
    return true;
  }
  return hit(faults_.loss);
}

void PacketImpairment::corrupt(Outgoing& packet) {
  if (packet.record.marker && hit(faults_.missing_marker)) {
    packet.header[1] &= 0x7FU;
    packet.record.marker_removed = true;
  }
  if (hit(faults_.corrupt_header)) {
    const std::size_t bit = up_to(packet.header.size() * 8 - 1);
    packet.header[bit / 8] ^= static_cast<std::uint8_t>(1U << (bit % 8));
    packet.record.corrupted_header = true;
  }
  packet.read_header();
  if (packet.payload.empty() || !hit(faults_.corrupt_payload)) return;
  packet.changed_payload.assign(packet.payload.begin(), packet.payload.end());
  for (std::size_t i = 0; i < faults_.corrupt_bits; ++i) {
    const std::size_t bit = up_to(packet.changed_payload.size() * 8 - 1);
    packet.changed_payload[bit / 8] ^= static_cast<std::uint8_t>(1U << (bit % 8));
  }
  packet.record.corrupted_payload = true;
}

void PacketImpairment::duplicate(const Outgoing& packet, std::vector<Outgoing>& leaving) {
  Outgoing copy = packet;
  copy.record.duplicate = true;
  const std::size_t behind = up_to(faults_.duplicate_distance);
  if (behind == 0) {
    leaving.push_back(std::move(copy));
  } else {
    held_.push_back({behind, std::move(copy)});
  }
}

void PacketImpairment::count_down(std::size_t held_before, std::vector<Outgoing>& leaving) {
  std::vector<Held> still_held;
  for (std::size_t i = 0; i < held_.size(); ++i) {
    if (i < held_before) --held_[i].behind;
    if (held_[i].behind == 0) {
      leaving.push_back(std::move(held_[i].packet));
    } else {
      still_held.push_back(std::move(held_[i]));
    }
  }
  held_ = std::move(still_held);
}

void PacketImpairment::offer(Outgoing packet, Time now, std::vector<Outgoing>& leaving) {
  const std::size_t held_before = held_.size();
  const bool struck = packet.record.picture >= faults_.first_picture && packet.record.picture <= faults_.last_picture;
  if (!struck) {
    burst_left_ = 0;
    leaving.push_back(std::move(packet));
  } else if (lost()) {
    packet.record.lost = true;
    leaving.push_back(std::move(packet));
  } else {
    corrupt(packet);
    const bool twice = hit(faults_.duplicate);
    const Outgoing original = twice ? packet : Outgoing{};
    if (hit(faults_.delay)) {
      packet.record.delayed = true;
      delayed_.emplace(now + faults_.delay_time, std::move(packet));
    } else if (faults_.reorder_distance > 0 && hit(faults_.reorder)) {
      packet.record.reordered = true;
      held_.push_back({1 + up_to(faults_.reorder_distance - 1), std::move(packet)});
    } else {
      leaving.push_back(std::move(packet));
    }
    if (twice) duplicate(original, leaving);
  }
  if (held_before > 0) count_down(held_before, leaving);
}

void PacketImpairment::release_due(Time now, std::vector<Outgoing>& leaving) {
  while (!delayed_.empty() && delayed_.begin()->first <= now) {
    leaving.push_back(std::move(delayed_.begin()->second));
    delayed_.erase(delayed_.begin());
  }
}

std::optional<PacketImpairment::Time> PacketImpairment::next_due() const {
  if (delayed_.empty()) return std::nullopt;
  return delayed_.begin()->first;
}

void PacketImpairment::release_held(std::vector<Outgoing>& leaving) {
  for (Held& held : held_) leaving.push_back(std::move(held.packet));
  held_.clear();
}

}  // namespace vexa::camera
