// SPDX-License-Identifier: Apache-2.0
#include "host/recording/playback_taker.h"

#include <algorithm>

#include "host/console/interrupt.h"

namespace vexa::host {
namespace {

using Clock = std::chrono::steady_clock;

constexpr std::chrono::milliseconds kLatePicture{500};  // that a picture of the last second may come late

std::chrono::microseconds stamp_of(const SLibDVideoFrameInfo& frame) {
  return std::chrono::seconds(frame.seconds) + std::chrono::microseconds(frame.microseconds);
}

}  // namespace

RecordingEnd PlaybackTaker::run(const Report& report) {
  Clock::time_point latest = Clock::now();
  for (;;) {
    if (Interrupt::requested()) return RecordingEnd::kInterrupted;
    SLibDVideoFrameInfo frame;
    frame.sink = &picture_;
    if (camera_.GetCurrentVideoFrame(frame) != LIBD_OK) {
      if (const auto end = end_of_silence(Clock::now() - latest)) return *end;
      Interrupt::wait(kPollPause);
      continue;
    }
    latest = Clock::now();
    if (!keep(frame)) return RecordingEnd::kCannotWrite;
    report(progress_);
  }
}

std::optional<RecordingEnd> PlaybackTaker::end_of_silence(Clock::duration quiet) const {
  const std::chrono::microseconds over = limits_.end + std::chrono::seconds(1);
  if (limits_.scale > 0 && progress_.frames > 0 && progress_.last >= limits_.end) {
    const std::chrono::microseconds to_come = std::max(over - progress_.last, std::chrono::microseconds(0));
    return quiet > to_come / limits_.scale + kLatePicture ? std::optional(RecordingEnd::kComplete) : std::nullopt;
  }
  if (quiet <= limits_.silence) return std::nullopt;
  if (progress_.frames == 0) return RecordingEnd::kNoKeyPicture;
  return limits_.scale < 0 ? RecordingEnd::kComplete : RecordingEnd::kSilent;
}

bool PlaybackTaker::keep(const SLibDVideoFrameInfo& frame) {
  const std::optional<Codec> codec = codec_of_frame(frame.frameType);
  if (!codec) return true;  // no picture
  const bool key = is_key_frame(frame.frameType);
  const std::chrono::microseconds time = stamp_of(frame);
  if (target_ != nullptr) {
    if (!key && progress_.frames == 0) return true;  // nothing could be decoded from here on
    problem_ = target_->write({picture_.bytes.data(), picture_.bytes.size(), *codec, key, time});
    if (problem_) return false;
  }
  if (progress_.frames++ == 0) progress_.first = time;
  progress_.bytes += picture_.bytes.size();
  progress_.last = time;
  return true;
}

}  // namespace vexa::host
