// SPDX-License-Identifier: Apache-2.0
// The figures of a recording so far.
#ifndef HOST_RECORDING_RECORDING_METER_H_
#define HOST_RECORDING_RECORDING_METER_H_

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <optional>

#include "host/picture/picture_decoder.h"

namespace vexa::host {

// Counts pictures, bytes and losses of one recording, on the recording's thread. Times are the host's, of a picture's
// arrival: live pictures carry no time stamps of their own.
class RecordingMeter {
 public:
  using Clock = std::chrono::steady_clock;

  void add(std::size_t bytes, bool key_picture, Clock::time_point now);
  // Pictures a second by the camera's settings, 0 for unknown. A rate that the stream itself states has precedence.
  void set_camera_rate(double rate) { camera_rate_ = rate; }
  void set_stream(const StreamParameters& stream) { stream_ = stream; }

  [[nodiscard]] std::uint64_t frames() const { return frames_; }
  [[nodiscard]] std::uint64_t key_frames() const { return key_frames_; }
  [[nodiscard]] std::uint64_t bytes() const { return bytes_; }
  [[nodiscard]] const std::optional<StreamParameters>& stream() const { return stream_; }

  // Pictures a second that the stream, or else the camera, states; 0 when neither does.
  [[nodiscard]] double stated_rate() const;

  // Since the first picture; zero before it.
  [[nodiscard]] std::chrono::duration<double> elapsed(Clock::time_point now) const;
  // Bits a second over the last two seconds.
  [[nodiscard]] double recent_bit_rate(Clock::time_point now) const;
  // Bits a second from the first picture to the last; 0 while there is no time between them.
  [[nodiscard]] double mean_bit_rate() const;

  // Pictures that a stream of the stated rate has sent from the first one received until now; nullopt when no rate is
  // stated. One picture may not have arrived yet. A camera that runs slower than its settings counts as losing
  // pictures: an estimate.
  [[nodiscard]] std::optional<std::uint64_t> expected_frames(Clock::time_point now) const;
  // Of those, the ones that did not come.
  [[nodiscard]] std::optional<std::uint64_t> missing_frames(Clock::time_point now) const;

 private:
  struct Arrival {
    Clock::time_point time;
    std::size_t bytes;
  };

  std::uint64_t frames_ = 0;
  std::uint64_t key_frames_ = 0;
  std::uint64_t bytes_ = 0;
  std::size_t last_bytes_ = 0;
  Clock::time_point first_{};
  Clock::time_point last_{};
  std::deque<Arrival> recent_;
  double camera_rate_ = 0;
  std::optional<StreamParameters> stream_;
};

}  // namespace vexa::host

#endif  // HOST_RECORDING_RECORDING_METER_H_
