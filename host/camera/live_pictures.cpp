// SPDX-License-Identifier: Apache-2.0
#include "host/camera/live_pictures.h"

#include <utility>

#include "host/console/interrupt.h"

namespace vexa::host {
namespace {

constexpr std::chrono::seconds kLongestWaitForKey{30};
// A camera that never sends a key frame again does not fill the memory.
constexpr std::size_t kMostKeptBytes = std::size_t{64} * 1024 * 1024;

}  // namespace

LivePictures::Polled LivePictures::poll() {
  SLibDVideoFrameInfo frame;
  frame.sink = this;
  const ELibDReturnCode result = camera_.GetCurrentVideoFrame(frame);
  if (result == LIBD_NO_FRAME) {
    Interrupt::wait(kPollPause);
    return Polled::kNone;
  }
  if (result != LIBD_OK) return Polled::kSilent;
  keep(frame.frameType);
  return Polled::kPicture;
}

void LivePictures::keep(std::int32_t frame_type) {
  const std::optional<Codec> codec = codec_of_frame(frame_type);
  if (!codec) return;
  const bool key = is_key_frame(frame_type);
  const std::lock_guard<std::mutex> lock(mutex_);
  if (key || group_bytes_ + received_.size() > kMostKeptBytes) {
    group_.frames.clear();
    group_bytes_ = 0;
  }
  if (key) group_.codec = *codec;
  if (!key && group_.frames.empty()) return;
  group_bytes_ += received_.size();
  group_.frames.push_back(std::exchange(received_, {}));
}

PictureGroup LivePictures::newest() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return group_;
}

bool LivePictures::has_picture() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return !group_.frames.empty();
}

std::optional<Problem> await_key_frame(LiveCamera& camera, LivePictures& pictures) {
  Interrupt::finish_orderly();  // a session that is open is closed
  const ELibDReturnCode started = pictures.start();
  if (started != LIBD_OK) return camera.explain(started);
  const auto give_up = std::chrono::steady_clock::now() + kLongestWaitForKey;
  while (!pictures.has_picture()) {
    if (Interrupt::requested()) {
      return Problem{ExitCode::kInterrupted, "interrupted before a picture came", "Nothing was written."};
    }
    if (pictures.poll() == LivePictures::Polled::kSilent) return silent_camera();
    if (std::chrono::steady_clock::now() > give_up) {
      return Problem{ExitCode::kNoVideo, "the camera has sent no key picture", "Shorten its key-frame interval."};
    }
  }
  return std::nullopt;
}

Problem silent_camera() {
  return {ExitCode::kNoVideo, "the camera has stopped sending pictures",
          "Check its network and encoder settings; --timeout makes the wait longer."};
}

}  // namespace vexa::host
