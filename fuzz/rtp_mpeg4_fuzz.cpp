// SPDX-License-Identifier: Apache-2.0
// Any datagrams: two bytes of length before each.
#include "fuzz/datagram_feed.h"
#include "media/assembly/elementary_unit.h"
#include "media/assembly/rtp_pictures.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  std::vector<unsigned char> frame(4096);
  vexa_fuzz::feed_datagrams({data, size}, vexa::kMpeg4Rules, [&frame](vexa::PacketRun packets) {
    const vexa::AssembledPicture picture = vexa::assemble_mpeg4(packets, frame);
    vexa::camera_position(vexa::front_of_user_data(vexa::Bytes(frame).first(picture.length)));
    return picture.outcome == vexa::Assembly::kWhole;
  });
  return 0;
}
