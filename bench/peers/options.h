// SPDX-License-Identifier: Apache-2.0
// What one measurement streams, and how.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace vexa_peers {

inline constexpr char kAddress[] = "127.0.1.1";
inline constexpr int kRtspPort = 554;
inline constexpr int kHttpPort = 8080;

struct Options {
  std::string peer = "driver";  ///< driver, waking, napping, draining, libavformat
  std::string codec = "h264";   ///< h264, mpeg4, jpeg
  double megabits = 8;          ///< of one stream, a second
  double frames_per_second = 25;
  double seconds = 5;
  std::size_t streams = 1;
  double link_megabits = 100;  ///< of each camera's port; 0: a picture's datagrams leave at once
  double loss = 0;             ///< share of the datagrams that is not sent
  std::uint32_t seed = 1;
  bool gso = false;     ///< one system call for many datagrams, where the system takes it; for link_megabits 0
  bool prompt = false;  ///< vexa::SetPromptFrames

  std::uint64_t pictures() const { return static_cast<std::uint64_t>(seconds * frames_per_second); }
};

}  // namespace vexa_peers
