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

}  // namespace vexa
