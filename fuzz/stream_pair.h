// SPDX-License-Identifier: Apache-2.0
// A stream socket of the driver's, and the camera's end of it.
#pragma once

#include <sys/socket.h>
#include <unistd.h>

#include "runtime/base/bytes.h"

namespace vexa_fuzz {

class StreamPair {
 public:
  StreamPair() {
    if (socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0, ends_) != 0) ends_[0] = -1;
  }
  StreamPair(const StreamPair&) = delete;
  StreamPair& operator=(const StreamPair&) = delete;

  bool valid() const { return ends_[0] >= 0; }
  /// Whoever takes it closes it.
  int of_driver() const { return ends_[0]; }
  void send(vexa::Bytes bytes) { ::send(ends_[1], bytes.data(), bytes.size(), MSG_NOSIGNAL | MSG_DONTWAIT); }
  /// The camera closes. Once.
  void end() { close(ends_[1]); }

 private:
  int ends_[2];
};

}  // namespace vexa_fuzz
