// SPDX-License-Identifier: Apache-2.0
// A camera within the fuzz target's process: connections that the driver makes end in it, without a network. It answers
// each request with the next record of the input. Takes the place of the C library's connect() and send() in the
// program that includes it, once.
#pragma once

#include <fcntl.h>
#include <sys/socket.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <cstddef>
#include <map>
#include <string>
#include <string_view>
#include <utility>

#include "fuzz/no_waiting.h"
#include "fuzz/records.h"

namespace vexa_fuzz {

/// One at a time: the latest one made. An answer that does not end its header, and the last one, end their connection,
/// so that nobody waits for more.
class InProcessCamera {
 public:
  explicit InProcessCamera(Records& records) : records_(records) { current() = this; }
  ~InProcessCamera() {
    for (const auto& [driver, camera] : ends_) close(camera);
    current() = nullptr;
  }
  InProcessCamera(const InProcessCamera&) = delete;
  InProcessCamera& operator=(const InProcessCamera&) = delete;

  static InProcessCamera*& current() {
    static InProcessCamera* camera = nullptr;
    return camera;
  }

  /// What comes before the bytes of each record.
  void begin_answers_with(std::string front) { front_ = std::move(front); }
  /// All that is left of the input goes to the connection with this end of the driver's, and ends it.
  void send_rest(int driver_end) {
    const auto found = ends_.find(driver_end);
    if (found == ends_.end()) return;
    while (const auto record = records_.next()) write(found->second, text_of(*record));
    shutdown(found->second, SHUT_WR);
  }

  int take_connection(int socket) {
    int ends[2];
    if (socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0, ends) != 0) return -1;
    const int flags = fcntl(socket, F_GETFL);
    dup3(ends[0], socket, O_CLOEXEC);
    close(ends[0]);
    fcntl(socket, F_SETFL, flags);
    if (const auto before = ends_.find(socket); before != ends_.end()) close(before->second);
    ends_[socket] = ends[1];
    return 0;
  }

  void take_request(int socket) {
    const auto found = ends_.find(socket);
    if (found == ends_.end()) return;
    char request[4096];
    while (recv(found->second, request, sizeof request, MSG_DONTWAIT) > 0) continue;
    const auto record = records_.next();
    const std::string answer = record ? front_ + std::string(text_of(*record)) : std::string();
    write(found->second, answer);
    if (records_.is_empty() || answer.find("\r\n\r\n") == std::string::npos) shutdown(found->second, SHUT_WR);
  }

 private:
  // What has no room any more is lost.
  static void write(int end, std::string_view bytes) {
    syscall(SYS_sendto, end, bytes.data(), bytes.size(), MSG_NOSIGNAL | MSG_DONTWAIT, nullptr, 0);
  }

  Records& records_;
  std::string front_;
  std::map<int, int> ends_;  ///< the camera's end by the driver's
};

}  // namespace vexa_fuzz

extern "C" int connect(int socket, const sockaddr*, socklen_t) {
  if (auto* camera = vexa_fuzz::InProcessCamera::current()) return camera->take_connection(socket);
  errno = ECONNREFUSED;
  return -1;
}

extern "C" ssize_t send(int socket, const void* bytes, std::size_t length, int flags) {
  const long sent = syscall(SYS_sendto, socket, bytes, length, flags, nullptr, 0);
  if (auto* camera = vexa_fuzz::InProcessCamera::current()) camera->take_request(socket);
  return sent;
}
