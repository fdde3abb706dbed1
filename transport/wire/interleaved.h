// RTP inside an RTSP connection (RFC 2326, 10.12): what stands before a packet, and how much of it is payload.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>

#include "runtime/base/bytes.h"

namespace vexa {

inline constexpr std::size_t kInterleavedPrefixSize = 4;
inline constexpr int kRtpVersionNumber = 2;

/// Bytes of the packet that follows; nothing when the prefix does not begin with "$". Whatever the channel.
std::optional<std::uint16_t> interleaved_length(Bytes prefix);

/// Control packets (RTCP) go on the odd channels.
inline bool is_control_channel(Bytes prefix) { return (prefix[1] & 1) != 0; }

/// What the first byte of an RTP header (RFC 3550, 5.1) tells on this way.
struct RtpFront {
  int version;
  std::size_t csrc_bytes;  ///< of the contributing sources between header and payload
};

RtpFront rtp_front(std::uint8_t first_byte);

/// Payload bytes of a packet of `length` bytes; nothing when header and sources alone are longer.
std::optional<std::size_t> interleaved_payload(std::uint16_t length, RtpFront front);

}  // namespace vexa
