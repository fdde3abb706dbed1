// Sends one session's RTP stream through its port at the pace of the pictures, by an absolute schedule.
#ifndef VIRTUAL_CAMERA_RTP_RTP_SENDER_H_
#define VIRTUAL_CAMERA_RTP_RTP_SENDER_H_

#include <asio.hpp>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "virtual_camera/rtp/fault_lane.h"
#include "virtual_camera/rtp/packet_port.h"
#include "virtual_camera/rtp/rtp_stream.h"
#include "virtual_camera/server/camera_state.h"

namespace vexa::camera {

class RtpSender : public std::enable_shared_from_this<RtpSender> {
 public:
  // `video`: the number of the camera's video stream. The port stands open.
  RtpSender(std::shared_ptr<CameraState> state, std::uint32_t session, int video, std::unique_ptr<PacketPort> port);

  // Starts with the first picture, after the pause, as the video stream is set. Nothing happens without a clip or when
  // already playing.
  void play(std::chrono::milliseconds pause);
  // The same with another source than the video stream's; not null.
  void play(std::unique_ptr<PictureSource> source, std::chrono::milliseconds pause);
  void stop();

 private:
  using Clock = std::chrono::steady_clock;
  using Time = FaultLane::Time;

  [[nodiscard]] Time paced(std::chrono::nanoseconds time) const;
  [[nodiscard]] std::optional<Time> next_burst() const;
  [[nodiscard]] std::optional<Time> next_event();
  void wait_for_next();
  void wait_for_source();
  [[nodiscard]] std::string user_data_of(const SourcePicture& picture) const;
  void begin_picture(Time now);
  void run_event();
  void offer_burst(Time now);
  void slip_if_far_behind(Time event);

  std::shared_ptr<CameraState> state_;
  const std::uint32_t session_;
  const int video_;
  const std::unique_ptr<PacketPort> port_;
  asio::steady_timer timer_;
  std::optional<RtpStream> stream_;
  std::optional<FaultLane> lane_;
  Clock::time_point started_;
  Clock::time_point not_before_;   // the pause after a burst
  std::vector<Outgoing> picture_;  // the picture under way
  Time picture_began_{0};
  std::size_t offered_ = 0;        // packets of it already offered
  std::size_t offered_bytes_ = 0;  // what they take on the wire
  std::vector<Outgoing> leaving_;
  bool waits_for_source_ = false;
  bool finished_ = false;
  bool stopped_ = false;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_RTP_RTP_SENDER_H_
