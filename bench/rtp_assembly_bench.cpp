// SPDX-License-Identifier: Apache-2.0
// The pure parts of the RTP path: header, order, collection, assembly.
#include <benchmark/benchmark.h>

#include <algorithm>
#include <chrono>
#include <cstdint>
#include <random>
#include <vector>

#include "media/assembly/packet_collector.h"
#include "media/assembly/rtp_pictures.h"
#include "transport/wire/packet_order.h"
#include "transport/wire/rtp_header.h"

namespace vexa {
namespace {

constexpr std::size_t kPayload = 1400;
constexpr int kClockRate = 90000;

/// One IDR slice of about a megabyte in fragments, as it would lie in the packet buffer.
class LargePicture {
 public:
  LargePicture() : bytes_(kPackets * kDatagram, 7) {
    for (std::size_t i = 0; i < kPackets; ++i) {
      unsigned char* datagram = bytes_.data() + i * kDatagram;
      datagram[12] = 0x7c;
      datagram[13] = i == 0 ? 0x85 : 0x05;
      SPacketInfo packet;
      packet.data = datagram;
      packet.length = kDatagram;
      packet.sequence = static_cast<std::uint16_t>(i);
      packet.timestamp = 20000000;
      packet.marker = i + 1 == kPackets;
      packets_.push_back(packet);
    }
  }
  PacketRun packets() const { return packets_; }

 private:
  static constexpr std::size_t kDatagram = kRtpHeaderSize + kPayload;
  static constexpr std::size_t kPackets = 1'000'000 / kPayload;
  std::vector<unsigned char> bytes_;
  std::vector<SPacketInfo> packets_;
};

void parse_header(benchmark::State& state) {
  const unsigned char datagram[] = {0x80, 0xe0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 0x65};
  for (auto _ : state) benchmark::DoNotOptimize(parse_rtp_header(datagram));
}
BENCHMARK(parse_header);

/// Each packet compared with the newest alone, whatever the number listed.
void place_in_order(benchmark::State& state) {
  std::vector<SPacketInfo> list(static_cast<std::size_t>(state.range(0)));
  for (std::size_t i = 0; i < list.size(); ++i) {
    list[i].timestamp = 20000000;
    list[i].sequence = static_cast<std::uint16_t>(i);
  }
  SPacketInfo next = list.back();
  ++next.sequence;
  for (auto _ : state) benchmark::DoNotOptimize(place_of(list, next));
}
BENCHMARK(place_in_order)->Arg(1)->Arg(100)->Arg(1500);

void place_out_of_order(benchmark::State& state) {
  std::vector<SPacketInfo> list(1500);
  for (std::size_t i = 0; i < list.size(); ++i) {
    list[i].timestamp = 20000000;
    list[i].sequence = static_cast<std::uint16_t>(2 * i);
  }
  SPacketInfo late = list[list.size() - 10];
  ++late.sequence;
  for (auto _ : state) benchmark::DoNotOptimize(place_of(list, late));
}
BENCHMARK(place_out_of_order);

/// Collecting a stream of ten-packet pictures: nanoseconds a packet.
void collect_in_order(benchmark::State& state) {
  std::vector<SPacketInfo> list;
  PacketCollector collector(list, kH264Rules);
  unsigned char datagram[14] = {};
  datagram[12] = 0x65;
  datagram[13] = 0x88;
  SPacketInfo packet;
  packet.data = datagram;
  packet.length = sizeof datagram;
  packet.timestamp = 20000000;
  const std::chrono::steady_clock::time_point now{};
  for (auto _ : state) {
    ++packet.sequence;
    packet.marker = packet.sequence % 10 == 0;
    collector.add(packet, kClockRate, now);
    if (const auto run = collector.next_picture(now)) collector.use(*run);
    if (packet.marker) packet.timestamp += 3600;
  }
  state.SetItemsProcessed(state.iterations());
}
BENCHMARK(collect_in_order);

void assemble_megabyte(benchmark::State& state) {
  const LargePicture picture;
  std::vector<unsigned char> frame(1200000);
  std::size_t length = 0;
  for (auto _ : state) {
    length = assemble_h264(picture.packets(), frame).length;
    benchmark::DoNotOptimize(frame.data());
  }
  state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(length));
}
BENCHMARK(assemble_megabyte);

}  // namespace
}  // namespace vexa
