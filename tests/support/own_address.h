// Loopback addresses that no other process of a parallel test run uses.
#pragma once

#include <unistd.h>

#include <string>

namespace vexa_test {

/// `index` is 0 to 15.
inline std::string own_loopback(unsigned index) {
  const auto pid = static_cast<unsigned>(getpid());
  return "127." + std::to_string(16 + (pid >> 12 & 15)) + "." + std::to_string(pid >> 4 & 255) + "." +
         std::to_string((pid & 15) * 16 + index);
}

}  // namespace vexa_test
