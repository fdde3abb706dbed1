// SPDX-License-Identifier: Apache-2.0
// The recording of one camera in segments, for as long as the program runs.
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>

#include "host/recording/recording_files.h"
#include "node/segments/segment_folder.h"
#include "vexa/session.h"

namespace vexa::node {

struct SegmentTimes {
  std::chrono::microseconds length{
      std::chrono::seconds(60)};                             ///< a segment ends at the first key picture after so long
  std::chrono::microseconds flush{std::chrono::seconds(2)};  ///< what a power cut may cost
};

/// What became of a camera's pictures since the program's start.
struct SegmentCounts {
  std::uint64_t pictures = 0;  ///< written
  std::uint64_t segments = 0;  ///< finished
  std::uint64_t failures = 0;  ///< of the disk: each has ended a segment
};

/// Writes the pictures of one session. When the disk fails, the segment is given up and repaired, and another is begun
/// 5 s later: the camera stays connected. Used on the thread that calls Process of the session's group.
class CameraSegments {
 public:
  using Report = std::function<void(const host::Problem&)>;

  CameraSegments(std::string camera, SegmentFolder folder, SegmentTimes times, Report report);
  ~CameraSegments();
  CameraSegments(const CameraSegments&) = delete;
  CameraSegments& operator=(const CameraSegments&) = delete;

  void take_state(const SessionStatus& status);
  void take_picture(const SessionFrame& frame);
  /// Ends the segment.
  void close();

  [[nodiscard]] const std::string& camera() const { return camera_; }
  [[nodiscard]] SegmentFolder& folder() { return folder_; }
  [[nodiscard]] const SegmentCounts& counts() const { return counts_; }

 private:
  class Segment;
  using Clock = std::chrono::steady_clock;

  [[nodiscard]] std::unique_ptr<host::RecordingFiles> make_files();
  void give_up(const host::Problem& problem);

  const std::string camera_;
  SegmentFolder folder_;
  const SegmentTimes times_;
  const Report report_;
  SegmentCounts counts_;
  std::uint64_t counter_ = 0;
  std::unique_ptr<host::RecordingFiles> files_;  // null after a failure, until retry_at_
  Clock::time_point retry_at_{};
};

}  // namespace vexa::node
