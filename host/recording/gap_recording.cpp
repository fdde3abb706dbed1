// SPDX-License-Identifier: Apache-2.0
#include "host/recording/gap_recording.h"

#include <filesystem>
#include <utility>

namespace vexa::host {
namespace {

// No gap has two files for its length.
constexpr std::chrono::hours kNoSegment{24 * 365 * 1000};
constexpr std::size_t kMostEnded = 1000;  // that are remembered

bool is_over(const Gap& gap) { return gap.state != GapState::kOpen && gap.state != GapState::kDue; }

}  // namespace

std::string name_of_gaps(const std::string& out) {
  const std::filesystem::path path(out);
  return (path.parent_path() / (path.stem().string() + "-gap" + path.extension().string())).string();
}

const char* word_of(GapState state) {
  switch (state) {
    case GapState::kOpen:
      return "open";
    case GapState::kDue:
      return "due";
    case GapState::kRecovered:
      return "recovered";
    case GapState::kPartial:
      return "partial";
    case GapState::kAbsent:
      return "absent";
    case GapState::kOverwritten:
      return "overwritten";
    case GapState::kRefused:
      return "refused";
  }
  return "";
}

GapRecording::GapRecording(const std::string& out, RecordingFiles::Open open)
    : files_(name_of_gaps(out), kNoSegment, std::move(open)) {}

BackfillCallbacks GapRecording::callbacks() {
  BackfillCallbacks callbacks;
  callbacks.frame = [this](const BackfillFrame& frame) { take_picture(frame); };
  callbacks.gap = [this](const Gap& gap) { take_gap(gap); };
  return callbacks;
}

void GapRecording::take_picture(const BackfillFrame& frame) {
  const std::lock_guard<std::mutex> lock(mutex_);
  const std::optional<Codec> codec = codec_of_frame(frame.frameType);
  if (problem_ || !codec) return;
  if (frame.gap != gap_) {
    files_.begin_anew();
    gap_ = frame.gap;
    has_pictures_ = false;
  }
  // A playback that was begun again goes on where the file ends.
  if (frame.leadsIn && has_pictures_) return;
  bool kept = false;
  problem_ = files_.write({frame.data, frame.length, *codec, frame.isKey, std::chrono::microseconds(frame.time)}, kept);
  has_pictures_ = has_pictures_ || (kept && !frame.leadsIn);
}

void GapRecording::take_gap(const Gap& gap) {
  if (!is_over(gap)) return;
  const std::lock_guard<std::mutex> lock(mutex_);
  if (gap.number == gap_) close_locked();
  ended_.push_back(gap);
  if (ended_.size() <= kMostEnded) return;
  ended_.pop_front();
  if (taken_ > 0) --taken_;
}

void GapRecording::close() {
  const std::lock_guard<std::mutex> lock(mutex_);
  close_locked();
}

void GapRecording::close_locked() {
  if (auto at_close = files_.close(); at_close && !problem_) problem_ = std::move(at_close);
  gap_ = 0;
}

std::vector<Gap> GapRecording::take_ended() {
  const std::lock_guard<std::mutex> lock(mutex_);
  const std::size_t first = std::exchange(taken_, ended_.size());
  return {ended_.begin() + static_cast<std::ptrdiff_t>(first), ended_.end()};
}

std::vector<Gap> GapRecording::ended() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return {ended_.begin(), ended_.end()};
}

std::optional<Problem> GapRecording::problem() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return problem_;
}

}  // namespace vexa::host
