// SPDX-License-Identifier: Apache-2.0
// Plays one recording of a camera's card and cuts it to a gap.
#pragma once

#include <cstdint>
#include <deque>
#include <functional>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "session/core/gap_cut.h"
#include "vexa/backfill.h"
#include "vexa/edge_storage_info.h"
#include "vexa/frame_facts.h"
#include "vexa/vexa_common.h"

namespace vexa {

/// How a playback ended.
enum class PlaybackEnd {
  kOver,     ///< the recording has ended, or the gap has
  kBroken,   ///< pictures came no more before that or were lost on the way, the camera was busy, or it was broken off
  kRefused,  ///< the camera does not play it: see the driver's latest failure
  kGone      ///< the camera has no such recording
};

/// Used by one thread. The driver is connected, and outlives this.
class RecordingPlayer {
 public:
  struct Orders {
    std::function<bool()> goes_on;                      ///< asked ten times a second
    std::function<void(const BackfillFrame&)> deliver;  ///< all but the gap's number
    bool takes_losses = false;                          ///< goes on where packets were lost
  };

  RecordingPlayer(CVexaCommon& driver, const BackfillOptions& options, Orders orders)
      : driver_(driver), options_(options), orders_(std::move(orders)) {}

  PlaybackEnd play(const SLibDEdgeStorageRecord& recording, GapCut& cut);
  [[nodiscard]] std::uint64_t bytes() const { return bytes_; }  ///< that have come

 private:
  struct Held {
    std::size_t number;
    std::int32_t type;
    std::int64_t camera_time;
    std::vector<unsigned char> bytes;
  };

  [[nodiscard]] std::optional<PlaybackEnd> start(const SLibDEdgeStorageRecord& recording);
  [[nodiscard]] bool has_lost(const SLibDVideoFrameInfo& frame, const FrameFacts& facts) const;
  [[nodiscard]] bool is_quiet_end(const SLibDEdgeStorageRecord& recording, std::int64_t quiet) const;
  /// Whether the gap is over.
  bool give(const GapCut::Verdict& verdict, const GapCut& cut);
  void give_one(const Held& picture, const GapCut& cut, bool leads_in);

  CVexaCommon& driver_;
  const BackfillOptions& options_;
  const Orders orders_;
  std::deque<Held> held_;
  std::size_t next_ = 0;
  std::int64_t latest_ = 0;  ///< camera's time of the latest picture
  std::uint64_t bytes_ = 0;
  bool is_first_ = true;
};

/// As the driver names the codec that a camera's list has; empty for one that cannot be played.
std::string codec_to_play(const std::string& listed);

}  // namespace vexa
