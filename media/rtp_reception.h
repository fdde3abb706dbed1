// What a running RTP stream keeps between two pictures.
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "media/assembly/codec.h"
#include "media/assembly/packet_collector.h"
#include "transport/burst_gather.h"
#include "transport/wire/packet_ring.h"

namespace vexa {

/// Identifies a picture by its first packet.
struct PictureName {
  std::uint32_t timestamp;
  std::uint16_t sequence;
  bool operator==(const PictureName&) const = default;
};

inline PictureName name_of(const SPacketInfo& first) { return {first.timestamp, first.sequence}; }

/// Made anew for every stream and every change of codec; the streaming thread's.
struct RtpReception {
  RtpReception(std::vector<SPacketInfo>& packets, const Codec& stream_codec, CollectionCounts& counts)
      : codec(stream_codec), collector(packets, stream_codec.rules, counts) {
    overwritten.reserve(PacketRing::kMostOverwritten);
  }

  /// Packets of another payload type are not collected.
  bool takes(const SPacketInfo& packet) const {
    return codec.rules.payload_type == kAnyPayloadType || packet.payloadType == codec.rules.payload_type;
  }

  const Codec& codec;
  PacketRing ring;
  PacketCollector collector;
  BurstGather gather;
  std::vector<PacketRing::Slot> overwritten;  // room for all that one packet can overwrite
  std::optional<PictureName> refused;         // the picture that was reported damaged and is still listed
};

}  // namespace vexa
