// RTP packets inside an RTSP connection.
#pragma once

#include <optional>
#include <span>

#include "runtime/base/result.h"
#include "transport/wire/rtp_header.h"

namespace vexa {

/// Fills `room`, waiting `timeout` milliseconds in all. Reads first and waits only when no byte is there.
Result<> receive_exactly(int socket, std::span<char> room, int timeout);

struct InterleavedPacket {
  int length = 0;  ///< of the payload in the caller's room
  RtpHeader header{};
};

/// Reads the next packet's payload into `room`, which has 65535 bytes or more; each part of it may take `timeout`.
/// No value when none came within a second.
Result<std::optional<InterleavedPacket>> receive_interleaved(int socket, std::span<char> room, int timeout);

}  // namespace vexa
