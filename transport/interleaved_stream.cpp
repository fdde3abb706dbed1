#include "transport/interleaved_stream.h"

#include <cerrno>
#include <iterator>
#include <utility>

#include "transport/failure.h"
#include "transport/socket.h"
#include "transport/wait_budget.h"
#include "transport/wire/rtp_header.h"

namespace vexa {
namespace {

constexpr std::size_t kLeastPacketRoom = 65535;
constexpr int kPacketWait = 1000;  // milliseconds, whatever the caller's time-out

Bytes bytes_of(std::span<const char> room) {
  return {reinterpret_cast<const unsigned char*>(room.data()), room.size()};
}

}  // namespace

Result<> receive_exactly(int socket, std::span<char> room, WaitLimit limit) {
  const WaitBudget budget(limit);
  for (std::size_t filled = 0; filled < room.size();) {
    const ssize_t received = receive_waiting(socket, room.data() + filled, room.size() - filled);
    if (received == 0) return kConnectionClosed;
    if (received > 0) {
      filled += static_cast<std::size_t>(received);
      continue;
    }
    if (errno != EAGAIN && errno != EWOULDBLOCK) return system_failure();
    const int ready = budget.wait_readable(socket);
    if (ready != 1) return wait_failure(ready, kReceiveTimedOut);
  }
  return {};
}

Result<std::optional<InterleavedPacket>> receive_interleaved(int socket, std::span<char> room, WaitLimit limit) {
  if (room.size() < kLeastPacketRoom) return kInvalidArgument;
  const int ready = WaitBudget(limit.of(kPacketWait)).wait_readable(socket);
  if (ready == 0) return std::optional<InterleavedPacket>();
  if (ready != 1) return wait_failure(ready, kReceiveTimedOut);
  char prefix[kInterleavedPrefixSize];
  if (const auto read = receive_exactly(socket, prefix, limit); !read) return read.failure();
  const auto length = interleaved_length(bytes_of(prefix));
  if (!length) return kNoDollar;
  char fixed[kRtpHeaderSize];
  if (const auto read = receive_exactly(socket, fixed, limit); !read) return read.failure();
  const RtpFront front = rtp_front(static_cast<std::uint8_t>(fixed[0]));
  if (front.version != kRtpVersionNumber) return kRtpVersion;
  // The contributing sources go where the payload will.
  if (const auto read = receive_exactly(socket, room.first(front.csrc_bytes), limit); !read) return read.failure();
  std::vector<unsigned char> control_front;
  if (is_control_channel(bytes_of(prefix))) {
    control_front.assign(std::begin(fixed), std::end(fixed));
    control_front.insert(control_front.end(), room.begin(),
                         room.begin() + static_cast<std::ptrdiff_t>(front.csrc_bytes));
  }
  const auto payload = interleaved_payload(*length, front);
  if (!payload) return kPayloadLength;
  if (const auto read = receive_exactly(socket, room.first(*payload), limit); !read) return read.failure();
  const Bytes header = bytes_of(fixed);
  return std::optional(InterleavedPacket{static_cast<int>(*payload), parse_rtp_header(header).value_or(RtpHeader{}),
                                         source_of(header), std::move(control_front)});
}

}  // namespace vexa
