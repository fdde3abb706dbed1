// What a running RTP stream keeps between two pictures.
#pragma once

#include <vector>

#include "media/assembly/packet_collector.h"
#include "transport/burst_gather.h"
#include "transport/wire/packet_ring.h"

namespace vexa {

/// Made anew for every stream; the streaming thread's.
struct RtpReception {
  RtpReception(std::vector<SPacketInfo>& packets, const PictureRules& rules) : collector(packets, rules) {}

  PacketRing ring;
  PacketCollector collector;
  BurstGather gather;
  std::vector<PacketRing::Slot> overwritten;  // room that is used again for every packet
};

}  // namespace vexa
