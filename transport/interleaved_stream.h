// RTP packets inside an RTSP connection.
#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <vector>

#include "runtime/base/result.h"
#include "transport/wait_budget.h"
#include "transport/wire/rtp_header.h"

namespace vexa {

/// Fills `room`; all its waits share the limit. Reads first and waits only when nothing is there.
Result<> receive_exactly(int socket, std::span<char> room, WaitLimit limit);

struct InterleavedPacket {
  int length = 0;  ///< of the payload in the caller's room
  RtpHeader header{};
  std::uint32_t ssrc = 0;
  /// What stood before the payload when the packet came on an odd channel, where control packets go; else empty.
  std::vector<unsigned char> control_front;
};

/// Reads the next packet's payload into `room`, which has 65535 bytes or more; each part of it may take the limit.
/// No value when none came within a second.
Result<std::optional<InterleavedPacket>> receive_interleaved(int socket, std::span<char> room, WaitLimit limit);

}  // namespace vexa
