// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/rtp/packet_port.h"

#include <cstdint>
#include <span>

namespace vexa::camera {
namespace {

std::uint64_t fnv1a(std::uint64_t hash, std::span<const std::uint8_t> bytes) {
  for (const std::uint8_t byte : bytes) hash = (hash ^ byte) * 1099511628211ULL;
  return hash;
}

}  // namespace

SentPacket record_of(const Outgoing& packet, std::chrono::steady_clock::time_point time, PacketPort::Hashing hashing) {
  SentPacket record = packet.record;
  record.time = time;
  if (hashing == PacketPort::Hashing::kOn) {
    record.hash = fnv1a(fnv1a(14695981039346656037ULL, packet.header), packet.payload_to_send());
  }
  return record;
}

}  // namespace vexa::camera
