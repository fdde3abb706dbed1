#include "transport/socket.h"

#include <fcntl.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>

namespace vexa {

Socket& Socket::operator=(Socket&& other) noexcept {
  if (this != &other) {
    if (valid()) close(descriptor_);
    descriptor_ = other.release();
  }
  return *this;
}

Socket::~Socket() {
  if (valid()) close(descriptor_);
}

bool send_once(int socket, const char* bytes, std::size_t length) {
  return send(socket, bytes, length, MSG_NOSIGNAL) == static_cast<ssize_t>(length);
}

ssize_t receive_waiting(int socket, char* buffer, std::size_t length) {
  ssize_t count = 0;
  do {
    count = recv(socket, buffer, length, MSG_DONTWAIT);
  } while (count < 0 && errno == EINTR);
  return count;
}

ssize_t receive_waiting_from(int socket, char* buffer, std::size_t length, std::uint32_t& sender) {
  sockaddr_in address{};
  ssize_t count = 0;
  do {
    socklen_t size = sizeof address;
    count = recvfrom(socket, buffer, length, MSG_DONTWAIT, reinterpret_cast<sockaddr*>(&address), &size);
  } while (count < 0 && errno == EINTR);
  sender = address.sin_family == AF_INET ? address.sin_addr.s_addr : 0;
  return count;
}

void shutdown_and_close(int socket) {
  if (socket < 0) return;
  shutdown(socket, SHUT_RDWR);
  close(socket);
}

bool make_nonblocking(int socket) {
  const int flags = fcntl(socket, F_GETFL);
  return flags >= 0 && fcntl(socket, F_SETFL, flags | O_NONBLOCK) == 0;
}

bool make_blocking(int socket) {
  const int flags = fcntl(socket, F_GETFL);
  return flags >= 0 && fcntl(socket, F_SETFL, flags & ~O_NONBLOCK) == 0;
}

}  // namespace vexa
