// SPDX-License-Identifier: Apache-2.0
// Any datagrams: two bytes of length before each.
#include "fuzz/datagram_feed.h"
#include "media/assembly/rtp_pictures.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  std::vector<unsigned char> frame(4096);
  vexa_fuzz::feed_datagrams({data, size}, vexa::kH264Rules, [&frame](vexa::PacketRun packets) {
    for (const SPacketInfo& packet : packets) vexa::supplemental_information(packet);
    return vexa::assemble_h264(packets, frame).outcome == vexa::Assembly::kWhole;
  });
  return 0;
}
