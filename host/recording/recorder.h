// SPDX-License-Identifier: Apache-2.0
// Writes live pictures from a driver to a file.
#ifndef HOST_RECORDING_RECORDER_H_
#define HOST_RECORDING_RECORDER_H_

#include <chrono>
#include <cstdint>
#include <functional>
#include <optional>
#include <vector>

#include "host/recording/picture_target.h"
#include "host/recording/recording_meter.h"
#include "vexa/library_device.h"

namespace vexa::host {

struct RecordingLimits {
  std::optional<double> seconds = {};        // from the first picture on
  std::optional<std::uint64_t> frames = {};  // with neither, a recording goes on until it is interrupted
  double camera_rate = 0;                    // pictures a second by the camera's settings; 0: unknown
  // Longest wait for the next picture. The driver itself may report silence only after twice the connection's time-out.
  std::chrono::milliseconds silence{5000};
  std::chrono::seconds first_picture{30};  // longest wait for the key picture that a recording begins with
  std::function<RecordingMeter::Clock::time_point()> now = RecordingMeter::Clock::now;
};

enum class RecordingEnd { kComplete, kInterrupted, kSilent, kNoKeyPicture, kCannotWrite };

// Its word in JSON, such as "complete".
[[nodiscard]] const char* name_of(RecordingEnd end);

// Receives one frame from the driver. Copies and returns, because the driver holds its queue meanwhile.
class PictureBytes final : public CDataSink {
 public:
  void Write(const unsigned char* data, unsigned int length) override { bytes.assign(data, data + length); }
  std::vector<unsigned char> bytes;
};

// Polls one driver and passes its frames to the target. Made by a command and used on its thread; owns neither driver
// nor target. Never starts or stops the video.
class Recorder {
 public:
  using Clock = RecordingMeter::Clock;
  using Progress = std::function<void(const RecordingMeter&, Clock::time_point)>;

  Recorder(CLibraryDevice& camera, PictureTarget& target, RecordingLimits limits);

  // Polls a camera that streams already until the limits, an interruption or a failure end the recording. The camera
  // goes on streaming; the target stays open.
  RecordingEnd run(const Progress& progress);

  [[nodiscard]] const RecordingMeter& meter() const { return meter_; }
  [[nodiscard]] const std::optional<Problem>& problem() const { return problem_; }  // of kCannotWrite

 private:
  [[nodiscard]] std::optional<RecordingEnd> limit_reached(Clock::time_point now) const;
  [[nodiscard]] bool keep(const SLibDVideoFrameInfo& frame, Clock::time_point now);
  [[nodiscard]] std::chrono::microseconds time_of(const SLibDVideoFrameInfo& frame, Clock::time_point now) const;

  CLibraryDevice& camera_;
  PictureTarget& target_;
  const RecordingLimits limits_;
  Clock::time_point start_;
  std::chrono::system_clock::time_point wall_start_ = std::chrono::system_clock::now();  // the same moment
  Clock::time_point last_picture_;
  PictureBytes picture_;
  RecordingMeter meter_;
  std::optional<Problem> problem_;
};

}  // namespace vexa::host

#endif  // HOST_RECORDING_RECORDER_H_
