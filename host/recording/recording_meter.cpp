// SPDX-License-Identifier: Apache-2.0
#include "host/recording/recording_meter.h"

#include <algorithm>
#include <cmath>

namespace vexa::host {
namespace {

constexpr std::chrono::seconds kRecent{2};

}  // namespace

void RecordingMeter::add(std::size_t bytes, bool key_picture, Clock::time_point now) {
  if (frames_ == 0) first_ = now;
  last_ = now;
  ++frames_;
  if (key_picture) ++key_frames_;
  bytes_ += bytes;
  last_bytes_ = bytes;
  recent_.push_back({now, bytes});
  while (now - recent_.front().time > kRecent) recent_.pop_front();
}

double RecordingMeter::stated_rate() const {
  return stream_ && stream_->frame_rate > 0 ? stream_->frame_rate : camera_rate_;
}

std::chrono::duration<double> RecordingMeter::elapsed(Clock::time_point now) const {
  if (frames_ == 0) return std::chrono::duration<double>(0);
  return now - first_;
}

double RecordingMeter::recent_bit_rate(Clock::time_point now) const {
  std::uint64_t bytes = 0;
  for (const Arrival& arrival : recent_) {
    if (now - arrival.time <= kRecent) bytes += arrival.bytes;
  }
  // In the first two seconds the window is as long as the recording, but never so short that one key picture fills it.
  const double seconds = std::clamp(elapsed(now).count(), 0.5, std::chrono::duration<double>(kRecent).count());
  return static_cast<double>(bytes) * 8 / seconds;
}

double RecordingMeter::mean_bit_rate() const {
  const double seconds = std::chrono::duration<double>(last_ - first_).count();
  if (seconds <= 0) return 0;
  // The last picture's time has not passed yet: its bytes belong to the interval after it.
  return static_cast<double>(bytes_ - last_bytes_) * 8 / seconds;
}

std::optional<std::uint64_t> RecordingMeter::expected_frames(Clock::time_point now) const {
  if (stated_rate() <= 0) return std::nullopt;
  if (frames_ == 0) return 0;
  const double to_last = std::round(std::chrono::duration<double>(last_ - first_).count() * stated_rate());
  const double to_now = std::floor(elapsed(now).count() * stated_rate()) - 1;
  return static_cast<std::uint64_t>(std::max(to_last, to_now)) + 1;
}

std::optional<std::uint64_t> RecordingMeter::missing_frames(Clock::time_point now) const {
  const std::optional<std::uint64_t> expected = expected_frames(now);
  if (!expected) return std::nullopt;
  return *expected > frames_ ? *expected - frames_ : 0;
}

}  // namespace vexa::host
