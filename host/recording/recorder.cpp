// SPDX-License-Identifier: Apache-2.0
#include "host/recording/recorder.h"

#include <utility>

#include "host/console/interrupt.h"

namespace vexa::host {

const char* name_of(RecordingEnd end) {
  switch (end) {
    case RecordingEnd::kComplete:
      return "complete";
    case RecordingEnd::kInterrupted:
      return "interrupted";
    case RecordingEnd::kSilent:
      return "silent";
    case RecordingEnd::kNoKeyPicture:
      return "noKeyPicture";
    case RecordingEnd::kCannotWrite:
      return "cannotWrite";
  }
  return "";
}

Recorder::Recorder(CLibraryDevice& camera, PictureTarget& target, RecordingLimits limits)
    : camera_(camera), target_(target), limits_(std::move(limits)), start_(limits_.now()), last_picture_(start_) {
  meter_.set_camera_rate(limits_.camera_rate);
}

RecordingEnd Recorder::run(const Progress& progress) {
  for (;;) {
    if (Interrupt::requested()) return RecordingEnd::kInterrupted;
    if (const auto end = limit_reached(limits_.now())) return *end;
    SLibDVideoFrameInfo frame;
    frame.sink = &picture_;
    const ELibDReturnCode result = camera_.GetCurrentVideoFrame(frame);
    const Clock::time_point now = limits_.now();
    if (result == LIBD_OK && !keep(frame, now)) return RecordingEnd::kCannotWrite;
    if (result == LIBD_NO_FRAME) Interrupt::wait(kPollPause);
    if (result != LIBD_OK && result != LIBD_NO_FRAME) return RecordingEnd::kSilent;
    progress(meter_, now);
  }
}

std::optional<RecordingEnd> Recorder::limit_reached(Clock::time_point now) const {
  if (meter_.frames() == 0) {
    if (now - start_ < limits_.first_picture) return std::nullopt;
    return RecordingEnd::kNoKeyPicture;
  }
  const bool enough_frames = limits_.frames && meter_.frames() >= *limits_.frames;
  const bool enough_time = limits_.seconds && meter_.elapsed(now).count() >= *limits_.seconds;
  if (enough_frames || enough_time) return RecordingEnd::kComplete;
  if (now - last_picture_ > limits_.silence) return RecordingEnd::kSilent;
  return std::nullopt;
}

// The driver stamps pictures of some streams only; the others get the time of their arrival.
std::chrono::microseconds Recorder::time_of(const SLibDVideoFrameInfo& frame, Clock::time_point now) const {
  if (frame.seconds != 0) return std::chrono::seconds(frame.seconds) + std::chrono::microseconds(frame.microseconds);
  return std::chrono::duration_cast<std::chrono::microseconds>(wall_start_.time_since_epoch() + (now - start_));
}

bool Recorder::keep(const SLibDVideoFrameInfo& frame, Clock::time_point now) {
  const std::optional<Codec> codec = codec_of_frame(frame.frameType);
  const bool key = is_key_frame(frame.frameType);
  if (!codec || (!key && meter_.frames() == 0)) return true;  // nothing could be decoded from here on
  problem_ = target_.write({picture_.bytes.data(), picture_.bytes.size(), *codec, key, time_of(frame, now)});
  if (problem_) return false;
  if (key && !meter_.stream()) {
    if (const auto stream = read_stream_parameters(*codec, picture_.bytes)) meter_.set_stream(*stream);
  }
  meter_.add(picture_.bytes.size(), key, now);
  last_picture_ = now;
  return true;
}

}  // namespace vexa::host
