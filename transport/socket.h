// Descriptors that close themselves, and sends that never raise SIGPIPE.
#pragma once

#include <sys/types.h>

#include <cstddef>
#include <cstdint>
#include <utility>

namespace vexa {

/// Owns a socket: closes it on every early exit, is released on success.
/// Made where a connection is opened; one thread at a time has it.
class Socket {
 public:
  Socket() = default;
  explicit Socket(int descriptor) : descriptor_(descriptor) {}
  Socket(Socket&& other) noexcept : descriptor_(other.release()) {}
  Socket& operator=(Socket&& other) noexcept;
  Socket(const Socket&) = delete;
  Socket& operator=(const Socket&) = delete;
  ~Socket();

  bool valid() const { return descriptor_ >= 0; }
  int get() const { return descriptor_; }
  int release() { return std::exchange(descriptor_, -1); }

 private:
  int descriptor_ = -1;
};

/// A connection that is read until the host stops the stream.
struct StoppableSocket {
  int socket;
  int stop;  ///< becomes readable when the stream is to end; -1: never
};

/// One send; true when all bytes went. A peer that has closed gives EPIPE, never a signal.
bool send_once(int socket, const char* bytes, std::size_t length);

/// What waits at the socket, one read; -1 with errno, EAGAIN when nothing does. A signal does not end it.
ssize_t receive_waiting(int socket, char* buffer, std::size_t length);

/// The same for a datagram, with the IPv4 address that sent it, in network order; 0 where it has none.
ssize_t receive_waiting_from(int socket, char* buffer, std::size_t length, std::uint32_t& sender);

/// Shuts the socket down both ways and closes it; errors and -1 are passed over.
void shutdown_and_close(int socket);

/// Set and clear O_NONBLOCK; false with errno on failure.
bool make_nonblocking(int socket);
bool make_blocking(int socket);

}  // namespace vexa
