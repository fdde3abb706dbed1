// SPDX-License-Identifier: Apache-2.0
// A bad network between a camera's RTP stream and its socket: packets are lost, late, repeated, reordered, damaged.
#ifndef VIRTUAL_CAMERA_RTP_PACKET_IMPAIRMENT_H_
#define VIRTUAL_CAMERA_RTP_PACKET_IMPAIRMENT_H_

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>
#include <random>
#include <vector>

#include "virtual_camera/rtp/rtp_stream.h"
#include "virtual_camera/values/faults.h"

namespace vexa::camera {

// Applies the faults of one stream. Owned by the RtpSender and used on its thread. Reads no clock: times are the
// camera's schedule, so that the same seed gives the same order on any machine.
class PacketImpairment {
 public:
  using Time = std::chrono::nanoseconds;  // since the stream's start, as scheduled

  PacketImpairment(PacketFaults faults, std::uint64_t seed);

  // Faults of the packets that come from now on; those held back or delayed stay so.
  void change(PacketFaults faults);

  // Takes the next packet of the stream and appends whatever leaves now, in order; lost packets too, marked so.
  void offer(Outgoing packet, Time now, std::vector<Outgoing>& leaving);
  // Appends the delayed packets whose time has come.
  void release_due(Time now, std::vector<Outgoing>& leaving);
  // When the next delayed packet leaves.
  [[nodiscard]] std::optional<Time> next_due() const;
  // The stream has ended: appends the packets that are still held back.
  void release_held(std::vector<Outgoing>& leaving);

 private:
  struct Held {
    std::size_t behind;  // later packets it still waits for
    Outgoing packet;
  };

  [[nodiscard]] bool hit(double probability);
  [[nodiscard]] std::size_t up_to(std::size_t most);  // 0 to most
  [[nodiscard]] bool lost();
  void corrupt(Outgoing& packet);
  void duplicate(const Outgoing& packet, std::vector<Outgoing>& leaving);
  void count_down(std::size_t held_before, std::vector<Outgoing>& leaving);

  PacketFaults faults_;
  std::mt19937_64 random_;
  std::size_t burst_left_ = 0;
  std::vector<Held> held_;
  std::multimap<Time, Outgoing> delayed_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_RTP_PACKET_IMPAIRMENT_H_
