// The RTCP port beside a media port.
#pragma once

#include <cstdint>
#include <optional>
#include <span>

#include "transport/socket.h"

namespace vexa {

/// A datagram socket on the port after `media_port`, with the kernel's times of arrival; invalid with errno where that
/// port is taken or there is none.
Socket bind_control_socket(int media_port);

struct ControlDatagram {
  std::size_t length = 0;
  std::uint32_t address = 0;  ///< of the sender, in network order
  std::uint16_t port = 0;     ///< of the sender, in network order
  std::int64_t arrival = 0;   ///< nanoseconds since 1970
};

/// What waits at the socket, without waiting; none when nothing does.
std::optional<ControlDatagram> receive_control(int socket, std::span<unsigned char> room);

/// Sends to an address and port in network order; what cannot go is dropped, as UDP may.
void send_control(int socket, std::uint32_t address, std::uint16_t port, std::span<const unsigned char> bytes);

/// When the datagram that was read last from `socket` came, in nanoseconds since 1970 by the kernel; none where the
/// socket has no such times.
std::optional<std::int64_t> arrival_of_latest(int socket);

}  // namespace vexa
