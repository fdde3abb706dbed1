// SPDX-License-Identifier: Apache-2.0
// Packets inside an RTSP connection, one after the other.
#include <cstddef>
#include <cstdint>
#include <cstdlib>

#include "transport/wire/rtp_header.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  vexa::ByteReader in(vexa::Bytes(data, size));
  while (in.ok()) {
    const auto length = vexa::interleaved_length(in.take(vexa::kInterleavedPrefixSize));
    if (!length) return 0;
    const vexa::Bytes header = in.take(vexa::kRtpHeaderSize);
    if (header.empty()) return 0;
    const vexa::RtpFront front = vexa::rtp_front(header[0]);
    const auto payload = vexa::interleaved_payload(*length, front);
    if (!payload) return 0;
    if (vexa::kRtpHeaderSize + front.csrc_bytes + *payload != *length) std::abort();
    in.take(front.csrc_bytes);
    in.take(*payload);
  }
  return 0;
}
