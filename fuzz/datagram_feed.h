// Any datagrams, two bytes of length before each, on their way through the collection of pictures.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <vector>

#include "media/assembly/packet_collector.h"
#include "runtime/base/bytes.h"
#include "transport/wire/rtp_header.h"

namespace vexa_fuzz {

inline std::vector<std::vector<std::uint8_t>> datagrams_of(vexa::Bytes input) {
  std::vector<std::vector<std::uint8_t>> datagrams;
  vexa::ByteReader in(input);
  while (in.ok()) {
    const vexa::Bytes datagram = in.take(in.u16() % 5000);
    if (in.ok()) datagrams.emplace_back(datagram.begin(), datagram.end());
  }
  return datagrams;
}

/// `assemble` is given the packets of each picture and tells whether they made one.
template <typename Assemble>
void feed_datagrams(vexa::Bytes input, const vexa::PictureRules& rules, Assemble assemble) {
  auto datagrams = datagrams_of(input);
  std::vector<SPacketInfo> list;
  vexa::PacketCollector collector(list, rules);
  std::chrono::steady_clock::time_point now{};
  for (auto& datagram : datagrams) {
    now += std::chrono::milliseconds(7);
    const auto header = vexa::parse_rtp_header(datagram);
    if (!header) continue;
    SPacketInfo packet;
    packet.data = datagram.data();
    packet.length = static_cast<std::uint32_t>(datagram.size());
    packet.marker = header->marker;
    packet.sequence = header->sequence;
    packet.timestamp = header->timestamp;
    collector.add(packet, 90000, now);
    while (const auto run = collector.next_picture(now)) {
      assemble(collector.packets(*run)) ? collector.use(*run) : collector.abandon(*run);
    }
  }
}

}  // namespace vexa_fuzz
