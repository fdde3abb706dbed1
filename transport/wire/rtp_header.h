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

/// None when the datagram is shorter than the header.
std::optional<RtpHeader> parse_rtp_header(Bytes datagram);

}  // namespace vexa
