// SPDX-License-Identifier: Apache-2.0
// What a camera's card recorded during outages, in files beside the recording.
#ifndef HOST_RECORDING_GAP_RECORDING_H_
#define HOST_RECORDING_GAP_RECORDING_H_

#include <cstdint>
#include <deque>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include "host/base/problem.h"
#include "host/recording/recording_files.h"
#include "vexa/backfill.h"

namespace vexa::host {

// One file for each gap, named as `out` with "-gap" and the time of its first picture. Made by one thread, called by
// those of a Backfill, which it outlives; any thread may ask.
class GapRecording {
 public:
  GapRecording(const std::string& out, RecordingFiles::Open open);

  [[nodiscard]] BackfillCallbacks callbacks();
  // Closes the latest file.
  void close();

  // Gaps that have ended since this was last asked.
  [[nodiscard]] std::vector<Gap> take_ended();
  // All gaps that have ended.
  [[nodiscard]] std::vector<Gap> ended() const;
  // The first failure to write; pictures after it are not kept.
  [[nodiscard]] std::optional<Problem> problem() const;

 private:
  void take_picture(const BackfillFrame& frame);
  void take_gap(const Gap& gap);
  void close_locked();

  mutable std::mutex mutex_;  // of what follows
  RecordingFiles files_;
  std::uint64_t gap_ = 0;      // whose pictures the file has
  bool has_pictures_ = false;  // of that gap, beside those that lead in
  std::deque<Gap> ended_;
  std::size_t taken_ = 0;
  std::optional<Problem> problem_;
};

// "live.mkv" is "live-gap.mkv".
[[nodiscard]] std::string name_of_gaps(const std::string& out);
// Such as "recovered".
[[nodiscard]] const char* word_of(GapState state);

}  // namespace vexa::host

#endif  // HOST_RECORDING_GAP_RECORDING_H_
