// SPDX-License-Identifier: Apache-2.0
// Sends one session's RTP stream through its port at the pace of the pictures, by an absolute schedule.
#ifndef VIRTUAL_CAMERA_RTP_RTP_SENDER_H_
#define VIRTUAL_CAMERA_RTP_RTP_SENDER_H_

#include <asio/steady_timer.hpp>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "virtual_camera/rtp/packet_impairment.h"
#include "virtual_camera/rtp/packet_port.h"
#include "virtual_camera/rtp/rtp_stream.h"
#include "virtual_camera/rtp/sender_report.h"
#include "virtual_camera/rtp/sent_log.h"
#include "virtual_camera/source/picture_source.h"
#include "virtual_camera/values/options.h"

namespace vexa::camera {

// One for each session, held by it and by its timer; on the loop's thread. Never drifts: each picture has a time of its
// own, counted from PLAY.
class RtpSender : public std::enable_shared_from_this<RtpSender> {
 public:
  // What a stream is played with.
  struct Play {
    std::unique_ptr<PictureSource> source;   // not null
    std::function<std::string()> user_data;  // of a picture that leaves now; not empty
    PacketFaults faults;
    std::uint64_t seed = 1;
    std::chrono::milliseconds pause{0};                                            // before the first picture
    std::chrono::system_clock::time_point now = std::chrono::system_clock::now();  // by the camera's clock
  };

  // The port is open. The context outlives the sender.
  RtpSender(asio::io_context& context, std::shared_ptr<const CameraOptions> options, std::shared_ptr<SentLog> sent,
            std::uint32_t session, std::unique_ptr<PacketPort> port);

  // Whether play() would start a stream: none plays, and stop() has not been called.
  [[nodiscard]] bool may_play() const { return !stream_ && !stopped_; }
  // Starts with the first picture. Has no effect unless may_play().
  void play(Play play);
  // Faults of the packets to come, where a stream plays. Restarts of numbers stay those it began with.
  void change_faults(PacketFaults faults);
  void stop();

 private:
  using Clock = std::chrono::steady_clock;
  using Time = PacketImpairment::Time;

  [[nodiscard]] Time paced(std::chrono::nanoseconds time) const;
  [[nodiscard]] std::optional<Time> next_burst() const;
  [[nodiscard]] std::optional<Time> next_event();
  void wait_for_next();
  void wait_for_source();
  [[nodiscard]] std::string user_data_of(const SourcePicture& picture) const;
  void begin_picture(Time now);
  [[nodiscard]] bool holds(Time event);
  void run_event();
  void report(std::chrono::nanoseconds picture_time);
  void offer_burst(Time now);
  void slip_if_far_behind(Time event);

  asio::io_context& context_;
  const std::shared_ptr<const CameraOptions> options_;
  const std::shared_ptr<SentLog> sent_;
  const std::uint32_t session_;
  const std::unique_ptr<PacketPort> port_;
  asio::steady_timer timer_;
  std::function<std::string()> user_data_;
  std::optional<RtpStream> stream_;
  std::optional<PacketImpairment> impairment_;
  std::optional<SenderReportWriter> reports_;
  Clock::time_point started_;
  Clock::time_point not_before_;   // the pause after a burst
  std::vector<Outgoing> picture_;  // the picture being sent
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
