// SPDX-License-Identifier: Apache-2.0
// A camera's end and the driver's end of a connection.
#pragma once

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <string>
#include <string_view>

namespace vexa_test {

class StreamPair {
 public:
  StreamPair() {
    int ends[2];
    EXPECT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends), 0);
    camera_ = ends[0];
    driver_ = ends[1];
    EXPECT_EQ(fcntl(driver_, F_SETFL, O_NONBLOCK), 0);
  }
  ~StreamPair() {
    hang_up();
    close(driver_);
  }
  StreamPair(const StreamPair&) = delete;
  StreamPair& operator=(const StreamPair&) = delete;

  int driver_end() const { return driver_; }

  void say(std::string_view bytes) const {
    ASSERT_EQ(send(camera_, bytes.data(), bytes.size(), MSG_NOSIGNAL), static_cast<ssize_t>(bytes.size()));
  }
  /// Closes the camera's end.
  void hang_up() {
    if (camera_ != -1) close(camera_);
    camera_ = -1;
  }
  /// What the driver has not taken.
  std::string left() const {
    char bytes[65536];
    const ssize_t got = recv(driver_, bytes, sizeof bytes, MSG_DONTWAIT);
    return got <= 0 ? std::string() : std::string(bytes, static_cast<std::size_t>(got));
  }

 private:
  int camera_ = -1;
  int driver_ = -1;
};

}  // namespace vexa_test
