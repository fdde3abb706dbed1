// SPDX-License-Identifier: Apache-2.0
#include "transport/wire/rtp_header.h"

namespace vexa {

// One check and plain reads: it runs for every datagram. The first byte (version, padding, extension, CSRC count) is
// not looked at: each transport has its own rule for it.
std::optional<RtpHeader> parse_rtp_header(Bytes datagram) {
  if (datagram.size() < kRtpHeaderSize) return std::nullopt;
  RtpHeader header;
  header.marker = (datagram[1] & 0x80) != 0;
  header.payload_type = datagram[1] & 0x7f;
  header.sequence = static_cast<std::uint16_t>(datagram[2] << 8 | datagram[3]);
  header.timestamp = std::uint32_t{datagram[4]} << 24 | std::uint32_t{datagram[5]} << 16 |
                     std::uint32_t{datagram[6]} << 8 | datagram[7];
  header.ssrc = source_of(datagram);
  return header;
}

std::optional<std::uint16_t> interleaved_length(Bytes prefix) {
  ByteReader in(prefix);
  const bool dollar = in.u8() == '$';
  // Kept: the channel is not looked at, so control packets pass for media; what they report is read beside.
  in.u8();
  const std::uint16_t length = in.u16();
  if (!dollar || !in.ok()) return std::nullopt;
  return length;
}

RtpFront rtp_front(std::uint8_t first_byte) {
  constexpr std::size_t kSourceSize = 4;
  return {first_byte >> 6, kSourceSize * (first_byte & 0x0f)};
}

std::optional<std::size_t> interleaved_payload(std::uint16_t length, RtpFront front) {
  const std::size_t before = kRtpHeaderSize + front.csrc_bytes;
  if (length < before) return std::nullopt;
  return length - before;
}

}  // namespace vexa
