// SPDX-License-Identifier: Apache-2.0
// One camera's recording by a session, through outages.
#ifndef HOST_RECORDING_CAMERA_RECORDING_H_
#define HOST_RECORDING_CAMERA_RECORDING_H_

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>

#include "host/recording/lost_pictures.h"
#include "host/recording/recorder.h"
#include "host/recording/recording_files.h"
#include "host/recording/recording_meter.h"
#include "vexa/session.h"

namespace vexa::host {

// Keeps what the session of one camera calls it with, and decides when its recording is over. Used on the thread that
// calls Process of the session's group. Owns neither session nor group, and stops nothing itself.
class CameraRecording {
 public:
  using Clock = RecordingMeter::Clock;

  struct Limits {
    std::optional<double> seconds = {};        // from the first picture on
    std::optional<std::uint64_t> frames = {};  // with neither, until it is interrupted
    bool forever = false;                      // a camera that is not there yet is waited for
    std::chrono::seconds first_picture{30};    // otherwise, how long
  };

  CameraRecording(std::string name, RecordingFiles files, Limits limits);

  void take_state(const SessionStatus& status, Clock::time_point now);
  // With the driver's count as it is then.
  void take_picture(const SessionFrame& frame, const StreamStatistics& counted, Clock::time_point now);
  // Time has passed.
  void look(Clock::time_point now);
  // The recording is over, for this reason where it was not: the files are closed.
  void end(RecordingEnd end, const StreamStatistics& counted, Clock::time_point now);

  [[nodiscard]] const std::string& name() const { return name_; }
  // Why it is to be ended.
  [[nodiscard]] const std::optional<RecordingEnd>& wanted_end() const { return wanted_; }
  [[nodiscard]] bool is_over() const { return over_; }
  [[nodiscard]] RecordingEnd how() const { return wanted_.value_or(RecordingEnd::kInterrupted); }
  [[nodiscard]] const std::optional<Problem>& problem() const { return problem_; }

  [[nodiscard]] const RecordingMeter& meter() const { return meter_; }
  [[nodiscard]] const RecordingFiles& files() const { return files_; }
  [[nodiscard]] const LostPictures& lost() const { return lost_; }
  [[nodiscard]] const std::optional<Codec>& codec() const { return codec_; }
  [[nodiscard]] Clock::time_point ended() const { return ended_; }
  // Between a picture and the next of another connection, or the end.
  [[nodiscard]] std::uint32_t outages() const { return outages_; }
  [[nodiscard]] std::chrono::duration<double> outage_time() const { return outage_time_; }
  [[nodiscard]] bool is_live() const { return status_.state == SessionState::kLive; }
  // Live, or why it is not: for a person.
  [[nodiscard]] const SessionStatus& status() const { return status_; }

 private:
  void fail(RecordingEnd end, std::optional<Problem> problem);
  void close_outage(Clock::time_point now);
  [[nodiscard]] bool has_begun() const { return meter_.frames() > 0; }

  const std::string name_;
  const Limits limits_;
  const Clock::time_point start_;
  const std::chrono::system_clock::time_point wall_start_;  // the same moment
  RecordingFiles files_;
  RecordingMeter meter_;
  SessionStatus status_;
  LostPictures before_;  // what the driver had counted when the recording began
  LostPictures lost_;
  std::optional<Codec> codec_;
  std::optional<Clock::time_point> last_picture_;
  bool in_outage_ = false;
  std::uint32_t outages_ = 0;
  std::chrono::duration<double> outage_time_{0};
  std::optional<RecordingEnd> wanted_;
  std::optional<Problem> problem_;
  bool over_ = false;
  Clock::time_point ended_{};
};

}  // namespace vexa::host

#endif  // HOST_RECORDING_CAMERA_RECORDING_H_
