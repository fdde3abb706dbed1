// SPDX-License-Identifier: Apache-2.0
#include "media/assembly/queue_policy.h"

#include "vexa/video_info.h"

namespace vexa {
namespace {

constexpr std::size_t kMostJpegFrames = 9;
constexpr std::size_t kMostOtherFrames = 30;

std::size_t jpeg_overflow(std::size_t waiting) { return waiting > kMostJpegFrames ? waiting - kMostJpegFrames : 0; }

bool is_key(std::int32_t frame_type) {
  return frame_type == VIDEO_FRAME_H264_KEY || frame_type == VIDEO_FRAME_MPEG4_KEY;
}

}  // namespace

QueueDecision decide_queue(std::int32_t frame_type, std::size_t waiting, bool& wait_key) {
  QueueDecision decision;
  if (frame_type == VIDEO_FRAME_JPEG) {
    decision.oldest_to_drop = jpeg_overflow(waiting);
  } else if (waiting > kMostOtherFrames) {
    decision.oldest_to_drop = waiting;
    wait_key = true;
  }
  if (frame_type == VIDEO_FRAME_INVALID) {
    wait_key = true;
    return decision;
  }
  decision.append = !wait_key || is_key(frame_type);
  if (decision.append) wait_key = false;
  return decision;
}

}  // namespace vexa
