// SPDX-License-Identifier: Apache-2.0
// Packets over bytes of their own, each allocated to its exact length.
#pragma once

#include <deque>
#include <vector>

#include "media/assembly/picture_rules.h"

namespace vexa::test {

using Payload = std::vector<unsigned char>;

class Packets {
 public:
  explicit Packets(const std::vector<Payload>& payloads) {
    for (const Payload& payload : payloads) {
      Payload datagram(12);
      datagram.insert(datagram.end(), payload.begin(), payload.end());
      datagram.shrink_to_fit();
      datagrams_.push_back(std::move(datagram));
      SPacketInfo packet;
      packet.data = datagrams_.back().data();
      packet.length = static_cast<std::uint32_t>(datagrams_.back().size());
      packets_.push_back(packet);
    }
  }
  operator PacketRun() const { return packets_; }
  const SPacketInfo& front() const { return packets_.front(); }

 private:
  std::deque<Payload> datagrams_;
  std::vector<SPacketInfo> packets_;
};

}  // namespace vexa::test
