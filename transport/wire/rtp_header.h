// What stands before the payload of an RTP packet: the fixed header (RFC 3550, 5.1), and the prefix of a packet inside
// an RTSP connection (RFC 2326, 10.12).
#pragma once

#include <cstddef>
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
