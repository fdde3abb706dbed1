// The stretch of bad network between a camera's RTP stream and its socket. It knows no clock: times are the camera's
// schedule, so that the same seed gives the same order on any machine.
#ifndef VIRTUAL_CAMERA_RTP_FAULT_LANE_H_
#define VIRTUAL_CAMERA_RTP_FAULT_LANE_H_

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

// Part of a session's RTP stream; used on the loop's thread.
class FaultLane {
 public:
  using Time = std::chrono::nanoseconds;  // since the stream's start, as scheduled

  FaultLane(PacketFaults faults, std::uint64_t seed);

  // Takes the next packet of the stream and appends whatever leaves now, in order; lost packets too, marked so.
  void offer(Outgoing packet, Time now, std::vector<Outgoing>& leaving);
  // Appends the delayed packets whose time has come.
  void release_due(Time now, std::vector<Outgoing>& leaving);
  // When the next delayed packet leaves.
  [[nodiscard]] std::optional<Time> next_due() const;
  // The stream has ended: appends the packets held back behind later ones.
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

  const PacketFaults faults_;
  std::mt19937_64 random_;
  std::size_t burst_left_ = 0;
  std::vector<Held> held_;
  std::multimap<Time, Outgoing> delayed_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_RTP_FAULT_LANE_H_
