// SPDX-License-Identifier: Apache-2.0
// What the frame queue does with a new frame when the host reads slower than the camera sends.
#pragma once

#include <cstddef>
#include <cstdint>

namespace vexa {

struct QueueDecision {
  std::size_t oldest_to_drop = 0;  ///< frames that leave the front of the queue, each by itself
  bool append = false;             ///< the new frame joins the queue; else it is freed
};

/// Decides for a frame of `frame_type` (an ELibDVideoFrameType value) and a queue of `waiting` frames. JPEG pictures
/// push out the oldest. A backlog of the other codecs is thrown away whole and `wait_key` set, so that no picture is
/// shown without its reference: only a key picture is appended then, and clears it.
QueueDecision decide_queue(std::int32_t frame_type, std::size_t waiting, bool& wait_key);

}  // namespace vexa
