// What a running RTP stream keeps between two pictures.
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "media/assembly/packet_collector.h"
#include "transport/burst_gather.h"
#include "transport/wire/packet_ring.h"

namespace vexa {

/// Tells a picture from every other by its first packet.
struct PictureName {
  std::uint32_t timestamp;
  std::uint16_t sequence;
  bool operator==(const PictureName&) const = default;
};

/// Made anew for every stream; the streaming thread's.
struct RtpReception {
  RtpReception(std::vector<SPacketInfo>& packets, const PictureRules& codec_rules)
      : rules(codec_rules), collector(packets, codec_rules) {
    overwritten.reserve(PacketRing::kMostOverwritten);
  }

  /// Packets of another payload type are not collected.
  bool takes(const SPacketInfo& packet) const {
    return rules.payload_type == kAnyPayloadType || packet.payloadType == rules.payload_type;
  }

  const PictureRules& rules;
  PacketRing ring;
  PacketCollector collector;
  BurstGather gather;
  std::vector<PacketRing::Slot> overwritten;  // room for all that one packet can overwrite
  std::optional<PictureName> refused;         // the picture that was told damaged and is still listed
};

}  // namespace vexa
