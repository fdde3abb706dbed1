// SPDX-License-Identifier: Apache-2.0
// A descriptor that closes itself; reading from one and writing all of something to one, across signals.
#ifndef HOST_BASE_UNIQUE_FD_H_
#define HOST_BASE_UNIQUE_FD_H_

#include <unistd.h>

#include <cstddef>
#include <utility>

namespace vexa::host {

// Owns one descriptor, or none (-1); moving hands it on. Never closes a descriptor that it does not own.
class UniqueFd {
 public:
  UniqueFd() = default;
  explicit UniqueFd(int fd) : fd_(fd) {}
  UniqueFd(UniqueFd&& other) noexcept : fd_(std::exchange(other.fd_, -1)) {}
  UniqueFd& operator=(UniqueFd&& other) noexcept {
    std::swap(fd_, other.fd_);
    return *this;
  }
  UniqueFd(const UniqueFd&) = delete;
  UniqueFd& operator=(const UniqueFd&) = delete;
  ~UniqueFd() { reset(); }

  [[nodiscard]] int get() const { return fd_; }
  [[nodiscard]] bool valid() const { return fd_ >= 0; }

  // Closes now. False when the system had kept a write error until the end.
  bool reset() { return fd_ < 0 || close(std::exchange(fd_, -1)) == 0; }

 private:
  int fd_ = -1;
};

// As read(2), begun again after a signal: how many bytes came, 0 at the end, -1 with errno.
[[nodiscard]] ssize_t read_some(int fd, void* room, std::size_t size);

// Writes every byte, across partial writes and signals. Returns 0, or the error's number.
[[nodiscard]] int write_all(int fd, const void* data, std::size_t length);

}  // namespace vexa::host

#endif  // HOST_BASE_UNIQUE_FD_H_
