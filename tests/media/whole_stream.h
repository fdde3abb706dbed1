// What must arrive of a stream with faults, and what does.
#pragma once

#include <chrono>
#include <cstdint>
#include <map>
#include <vector>

#include "tests/media/live_camera.h"

namespace vexa_test {

/// What must arrive of the stream that the camera logged: a picture whose packets all left, after a key picture
/// without a gap.
inline std::vector<std::uint64_t> predicted(const LiveCamera& camera,
                                            const std::vector<vexa::camera::SentPacket>& sent) {
  std::map<std::uint64_t, std::size_t> left;
  std::map<std::uint64_t, std::size_t> packets;
  for (const vexa::camera::SentPacket& packet : sent) {
    packets[packet.picture] = packet.picture_packets;
    if (!packet.lost && !packet.duplicate) ++left[packet.picture];
  }
  std::vector<std::uint64_t> delivered;
  bool chain = false;
  for (const auto& [picture, count] : packets) {
    chain = left[picture] == count && (chain || camera.is_key(picture));
    if (chain) delivered.push_back(picture);
  }
  return delivered;
}

/// The frames of a stream that ends by itself, `wanted` by now at the latest; one more when there is one too many.
inline std::vector<TakenFrame> take_whole_stream(LiveCamera& camera, MediaDriver& driver,
                                                 std::vector<std::uint64_t>& wanted) {
  FrameTaker host;
  std::vector<TakenFrame> frames;
  const auto take_more = [&](std::size_t count, std::chrono::milliseconds patience) {
    const auto more = host.take_all(driver, count, patience);
    frames.insert(frames.end(), more.begin(), more.end());
  };
  while (camera->sent().finished_streams() == 0) take_more(frames.max_size(), std::chrono::milliseconds(50));
  wanted = predicted(camera, camera->sent().snapshot());
  if (frames.size() < wanted.size()) take_more(wanted.size() - frames.size(), std::chrono::seconds(10));
  take_more(1, std::chrono::milliseconds(300));  // longer than a picture is ever held back
  return frames;
}

}  // namespace vexa_test
