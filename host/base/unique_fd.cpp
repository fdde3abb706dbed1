// SPDX-License-Identifier: Apache-2.0
#include "host/base/unique_fd.h"

#include <poll.h>
#include <unistd.h>

#include <cerrno>

namespace vexa::host {
namespace {

// A pipe that another process has made non-blocking must not cost a byte.
void wait_for_room(int fd) {
  pollfd room{fd, POLLOUT, 0};
  poll(&room, 1, -1);
}

}  // namespace

ssize_t read_some(int fd, void* room, std::size_t size) {
  ssize_t count = 0;
  do {
    count = read(fd, room, size);
  } while (count < 0 && errno == EINTR);
  return count;
}

int write_all(int fd, const void* data, std::size_t length) {
  const auto* bytes = static_cast<const unsigned char*>(data);
  while (length > 0) {
    const ssize_t written = write(fd, bytes, length);
    if (written >= 0) {
      bytes += written;
      length -= static_cast<std::size_t>(written);
      continue;
    }
    const int error = errno;
    if (error == EAGAIN) wait_for_room(fd);
    if (error != EINTR && error != EAGAIN) return error;
  }
  return 0;
}

}  // namespace vexa::host
