// SPDX-License-Identifier: Apache-2.0
// Takes the pictures of a recording that a camera plays.
#ifndef HOST_RECORDING_PLAYBACK_TAKER_H_
#define HOST_RECORDING_PLAYBACK_TAKER_H_

#include <chrono>
#include <cstdint>
#include <functional>
#include <optional>

#include "host/recording/picture_target.h"
#include "host/recording/recorder.h"
#include "vexa/library_device.h"

namespace vexa::host {

struct PlaybackLimits {
  std::chrono::seconds end;  // of the recording: when its last second begins
  int scale = 1;
  std::chrono::milliseconds silence{5000};  // longest wait for a picture before the end
};

// The figures of a playback so far. Times are those of the pictures as they were recorded, since 1970.
struct PlaybackProgress {
  std::uint64_t frames = 0;
  std::uint64_t bytes = 0;
  std::chrono::microseconds first{0};
  std::chrono::microseconds last{0};

  [[nodiscard]] std::chrono::duration<double> taken() const { return last - first; }
};

// Cameras do not report the end of a playback. Forward it has ended when a picture of the recording's last second has
// come and that second is over; backward, when pictures no longer come.
class PlaybackTaker {
 public:
  using Report = std::function<void(const PlaybackProgress&)>;

  // Without a target pictures are counted only, from the first; with one, from the first key picture.
  PlaybackTaker(CLibraryDevice& camera, PictureTarget* target, PlaybackLimits limits)
      : camera_(camera), target_(target), limits_(limits) {}

  // Polls a camera that plays already; it goes on playing, and the target stays open.
  RecordingEnd run(const Report& report);

  [[nodiscard]] const PlaybackProgress& progress() const { return progress_; }
  [[nodiscard]] const std::optional<Problem>& problem() const { return problem_; }  // of kCannotWrite

 private:
  [[nodiscard]] bool keep(const SLibDVideoFrameInfo& frame);
  [[nodiscard]] std::optional<RecordingEnd> end_of_silence(std::chrono::steady_clock::duration quiet) const;

  CLibraryDevice& camera_;
  PictureTarget* const target_;
  const PlaybackLimits limits_;
  PictureBytes picture_;
  PlaybackProgress progress_;
  std::optional<Problem> problem_;
};

}  // namespace vexa::host

#endif  // HOST_RECORDING_PLAYBACK_TAKER_H_
