// What became of the frames that reached the queue.
#pragma once

#include <cstdint>

#include "vexa/frame_facts.h"

namespace vexa {

struct QueueCounts {
  std::uint64_t from_reader = 0;  ///< frames that the streaming thread had assembled
  std::uint64_t from_elsewhere = 0;
  std::uint64_t handed_out = 0;
  std::uint64_t dropped_full = 0;
  std::uint64_t dropped_without_key = 0;
  std::uint64_t dropped_no_memory = 0;
  std::uint64_t dropped_at_stop = 0;

  std::uint64_t held() const {
    return from_reader + from_elsewhere - handed_out - dropped_full - dropped_without_key - dropped_no_memory -
           dropped_at_stop;
  }
};

/// What stands between two frames that are handed out.
struct LostFrames {
  std::uint64_t frames = 0;
  std::uint64_t packets = 0;
  std::uint32_t discontinuity = 0;  ///< FrameDiscontinuity bits of the lost
};

/// What is known of a frame in the queue beside its record.
struct QueuedFacts {
  const unsigned char* data = nullptr;  ///< the frame's, which identifies it
  bool is_notice = false;               ///< an empty frame that reports a damaged picture, and counts as none
  FrameFacts facts;

  /// What the next frame lacks when this one is lost.
  LostFrames as_lost() const {
    if (is_notice) return {};
    const std::uint64_t packets =
        (facts.valid & FRAME_FACTS_SEQUENCE) != 0 ? facts.lastSequence - facts.firstSequence + 1 : 0;
    return {facts.framesLostBefore + 1, facts.packetsLostBefore + packets, facts.discontinuity};
  }
  void add(const LostFrames& lost) {
    facts.framesLostBefore += lost.frames;
    facts.packetsLostBefore += lost.packets;
    facts.discontinuity |= lost.discontinuity;
  }
};

}  // namespace vexa
