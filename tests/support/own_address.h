// SPDX-License-Identifier: Apache-2.0
// Loopback addresses that no other process of a parallel test run uses.
#pragma once

#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cstddef>
#include <cstring>
#include <stdexcept>
#include <string>

namespace vexa_test {

/// A block of sixteen addresses, this process's as long as it lives. Its name among the network's abstract sockets,
/// which the system gives to one process alone, keeps it apart from every other; process numbers repeat.
class OwnAddresses {
 public:
  OwnAddresses() {
    const int claim = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);  // held until the process ends
    const auto wish = static_cast<unsigned>(getpid());
    for (unsigned tried = 0; tried < kBlocks; ++tried) {
      block_ = (wish + tried) % kBlocks;
      if (take(claim)) return;
    }
    throw std::runtime_error("no loopback address for a test");
  }

  /// `index` is 0 to 15.
  std::string at(unsigned index) const {
    return "127." + std::to_string(128 + (block_ >> 12)) + "." + std::to_string(block_ >> 4 & 255) + "." +
           std::to_string((block_ & 15) * 16 + index);
  }

 private:
  static constexpr unsigned kBlocks = 1U << 18;

  bool take(int claim) const {
    sockaddr_un name{};
    name.sun_family = AF_UNIX;
    const std::string text = "vexa-test-addresses-" + std::to_string(block_);
    std::memcpy(name.sun_path + 1, text.data(), text.size());  // a zero before it makes it abstract
    const auto length = static_cast<socklen_t>(offsetof(sockaddr_un, sun_path) + 1 + text.size());
    return bind(claim, reinterpret_cast<const sockaddr*>(&name), length) == 0;
  }

  unsigned block_ = 0;
};

/// Taken before the first test counts descriptors.
inline const OwnAddresses kOwnAddresses;

/// `index` is 0 to 15.
inline std::string own_loopback(unsigned index) { return kOwnAddresses.at(index); }

}  // namespace vexa_test
