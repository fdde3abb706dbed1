// SPDX-License-Identifier: Apache-2.0
#include "host/recording/camera_recording.h"

#include <fmt/format.h>

#include <utility>

#include "host/picture/picture_decoder.h"
#include "host/words/session_words.h"

namespace vexa::host {
CameraRecording::CameraRecording(std::string name, RecordingFiles files, Limits limits)
    : name_(std::move(name)),
      limits_(limits),
      start_(Clock::now()),
      wall_start_(std::chrono::system_clock::now()),
      files_(std::move(files)) {}

void CameraRecording::take_state(const SessionStatus& status, Clock::time_point now) {
  status_ = status;
  if (over_ || wanted_) return;
  if (status.cause == SessionCause::kStreamChanged && status.state == SessionState::kLive) files_.begin_anew();
  if (status.state != SessionState::kLive && has_begun() && !in_outage_) {
    in_outage_ = true;
    ++outages_;
  }
  if (auto problem = hopeless(name_, status)) fail(RecordingEnd::kSilent, std::move(problem));
  look(now);
}

void CameraRecording::take_picture(const SessionFrame& frame, const StreamStatistics& counted, Clock::time_point now) {
  look(now);
  const std::optional<Codec> codec = codec_of_frame(frame.frameType);
  if (over_ || wanted_ || !codec) return;
  if (frame.isFirst) files_.miss();
  const auto time =
      std::chrono::duration_cast<std::chrono::microseconds>(wall_start_.time_since_epoch() + (now - start_));
  bool kept = false;
  const RecordedPicture picture{frame.data, frame.length, *codec, frame.isKey, time};
  if (auto problem = files_.write(picture, kept)) {
    fail(RecordingEnd::kCannotWrite, std::move(problem));
    return;
  }
  if (!kept) return;
  if (!has_begun()) {
    // The picture itself is counted with those of the recording.
    StreamStatistics before = counted;
    before.framesBegun -= before.framesBegun > 0 ? 1 : 0;
    before_ = LostPictures(before);
  }
  if (in_outage_) close_outage(now);
  if (frame.isKey && (!meter_.stream() || codec_ != codec)) {
    if (const auto stream = read_stream_parameters(*codec, FrameBytes(frame.data, frame.data + frame.length))) {
      meter_.set_stream(*stream);
    }
  }
  codec_ = codec;
  meter_.add(frame.length, frame.isKey, now);
  last_picture_ = now;
  look(now);
}

void CameraRecording::look(Clock::time_point now) {
  if (over_ || wanted_) return;
  if (!has_begun()) {
    if (limits_.forever || now - start_ < limits_.first_picture) return;
    fail(RecordingEnd::kNoKeyPicture,
         Problem{ExitCode::kNoVideo,
                 fmt::format("{} has sent no picture within {} s", name_, limits_.first_picture.count()),
                 "Check address, power and network; --forever waits for it."});
    return;
  }
  const bool enough_frames = limits_.frames && meter_.frames() >= *limits_.frames;
  const bool enough_time = limits_.seconds && meter_.elapsed(now).count() >= *limits_.seconds;
  if (enough_frames || enough_time) wanted_ = RecordingEnd::kComplete;
}

void CameraRecording::end(RecordingEnd end, const StreamStatistics& counted, Clock::time_point now) {
  if (std::exchange(over_, true)) return;
  if (!wanted_) wanted_ = end;
  ended_ = now;
  if (in_outage_) close_outage(now);
  if (has_begun()) lost_ = LostPictures(counted).since(before_);
  if (auto at_close = files_.close(); at_close && !problem_) {
    problem_ = std::move(at_close);
    wanted_ = RecordingEnd::kCannotWrite;
  }
}

void CameraRecording::fail(RecordingEnd end, std::optional<Problem> problem) {
  wanted_ = end;
  problem_ = std::move(problem);
}

void CameraRecording::close_outage(Clock::time_point now) {
  in_outage_ = false;
  if (last_picture_) outage_time_ += now - *last_picture_;
}

}  // namespace vexa::host
