#include "transport/wire/rtp_header.h"

namespace vexa {

std::optional<RtpHeader> parse_rtp_header(Bytes datagram) {
  ByteReader in(datagram);
  in.u8();  // version, padding, extension, CSRC count: each transport has its own rule for them
  const std::uint8_t type = in.u8();
  RtpHeader header;
  header.marker = (type & 0x80) != 0;
  header.payload_type = type & 0x7f;
  header.sequence = in.u16();
  header.timestamp = in.u32();
  in.u32();  // SSRC: one source a session
  if (!in.ok()) return std::nullopt;
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
