// Any datagrams: two bytes of length before each.
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <vector>

#include "media/assembly/h264_units.h"
#include "media/assembly/packet_collector.h"
#include "transport/wire/rtp_header.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  std::vector<std::vector<std::uint8_t>> datagrams;
  vexa::ByteReader in(vexa::Bytes(data, size));
  while (in.ok()) {
    const vexa::Bytes datagram = in.take(in.u16() % 2048);
    if (in.ok()) datagrams.emplace_back(datagram.begin(), datagram.end());
  }
  std::vector<SPacketInfo> list;
  std::vector<unsigned char> frame(4096);
  vexa::PacketCollector collector(list, vexa::kH264Rules);
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
      const bool whole = vexa::assemble_h264(collector.packets(*run), frame).outcome == vexa::Assembly::kWhole;
      whole ? collector.use(*run) : collector.abandon(*run);
    }
  }
  return 0;
}
