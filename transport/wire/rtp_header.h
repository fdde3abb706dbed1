// The fixed header of an RTP packet (RFC 3550, 5.1).
#pragma once

#include <cstdint>
#include <optional>

#include "runtime/base/bytes.h"

namespace vexa {

inline constexpr std::size_t kRtpHeaderSize = 12;

struct RtpHeader {
  bool marker = false;
  std::uint8_t payload_type = 0;
  std::uint16_t sequence = 0;
  std::uint32_t timestamp = 0;
};

/// The SSRC of a packet of at least kRtpHeaderSize bytes.
inline std::uint32_t source_of(Bytes packet) {
  return std::uint32_t{packet[8]} << 24 | std::uint32_t{packet[9]} << 16 | std::uint32_t{packet[10]} << 8 | packet[11];
}

/// None when the datagram is shorter than the header.
std::optional<RtpHeader> parse_rtp_header(Bytes datagram);

}  // namespace vexa
