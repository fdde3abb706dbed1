// SPDX-License-Identifier: Apache-2.0
// Which of a card's recordings may hold pictures of a gap, and by which clock.
#pragma once

#include <cstdint>
#include <set>
#include <string>
#include <vector>

#include "session/core/gap_cut.h"
#include "vexa/backfill.h"
#include "vexa/edge_storage_info.h"

namespace vexa {

/// A recording to be played for a gap.
struct PlannedRecording {
  SLibDEdgeStorageRecord record;
  CutPlan plan;
  bool by_content = false;  ///< the camera's clock is not known: cut where its pictures are those that came live
};

/// What is known of a card.
struct CardView {
  std::vector<SLibDEdgeStorageRecord> records;
  std::set<std::string> fresh;  ///< were not there when it was last listed before the gap
  std::int64_t listed = 0;      ///< when that was, by the host's clock; 0: it was never listed
};

/// In the order of their times. `others`: the gaps whose recordings this one must not take.
std::vector<PlannedRecording> plan_recordings(const Gap& gap, const CardView& card, const std::vector<Gap>& others,
                                              const BackfillOptions& options);

}  // namespace vexa
