// SPDX-License-Identifier: Apache-2.0
// Any datagrams: two bytes of length before each. What is made of them begins and is as long as a JFIF picture.
#include <cstdlib>

#include "fuzz/datagram_feed.h"
#include "media/assembly/rtp_pictures.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  constexpr std::size_t kLeastHeader = 605;
  std::vector<unsigned char> beginning(vexa::kJpegFirstPacketRoom);
  std::vector<unsigned char> frame(8192);
  vexa_fuzz::feed_datagrams({data, size}, vexa::kJpegRules, [&](vexa::PacketRun packets) {
    const auto length = vexa::begin_jfif(beginning, vexa::payload_of(packets.front()));
    if (!length) return false;
    if (*length < kLeastHeader || *length > beginning.size()) std::abort();
    if (beginning[0] != 0xff || beginning[1] != 0xd8) std::abort();
    const vexa::Bytes begun = vexa::Bytes(beginning).first(*length);
    return vexa::assemble_jpeg(begun, packets.subspan(1), frame).outcome == vexa::Assembly::kWhole;
  });
  return 0;
}
