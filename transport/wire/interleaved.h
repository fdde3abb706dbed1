// RTP inside an RTSP connection (RFC 2326, 10.12): the prefix of a packet, and how much of the packet is payload.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>

#include "runtime/base/bytes.h"

namespace vexa {

inline constexpr std::size_t kInterleavedPrefixSize = 4;
inline constexpr int kRtpVersionNumber = 2;

/// Bytes of the packet that follows, on whatever channel; nullopt when the prefix does not begin with "$".
std::optional<std::uint16_t> interleaved_length(Bytes prefix);

/// The fields of an RTP header's first byte (RFC 3550, 5.1), as this transport reads them.
struct RtpFront {
  int version;
  std::size_t csrc_bytes;  ///< of the contributing sources between header and payload
};

RtpFront rtp_front(std::uint8_t first_byte);

/// Payload bytes of a packet of `length` bytes; nullopt when header and sources alone are longer.
std::optional<std::size_t> interleaved_payload(std::uint16_t length, RtpFront front);

}  // namespace vexa
