// SPDX-License-Identifier: Apache-2.0
#include "session/core/gap_plan.h"

#include <algorithm>
#include <cstdlib>

namespace vexa {
namespace {

constexpr std::int64_t kSecond = 1000000;  // microseconds
// Clocks that differ by less are one clock.
constexpr std::int64_t kJump = kSecond;
// A picture's time on the wire and in a recording differ by rounding; two pictures are further apart.
constexpr std::int64_t kSame = 4000;

// A clock of the camera, and the gap as far as it is known by it.
struct CameraClock {
  CutPlan plan;
  bool has_jumped = false;
  bool is_known = true;
};

std::vector<CameraClock> clocks_of(const Gap& gap, const BackfillOptions& options) {
  const std::int64_t before = gap.cameraBegin - gap.begin;
  const std::int64_t after = gap.cameraEnd - gap.end;
  CutPlan plan;
  plan.begin = gap.begin;
  plan.end = gap.end;
  if (gap.cameraBegin == 0 && gap.cameraEnd == 0) {
    plan.offset = options.clockOffsetMilliseconds * 1000;
    plan.uncertainty = std::max<std::int64_t>(options.clockUncertaintyMilliseconds, 0) * 1000;
    return {{plan, false, false}};
  }
  CutPlan by_first = plan;
  by_first.offset = before;
  by_first.begin += kSame;
  CutPlan by_second = plan;
  by_second.offset = after;
  by_second.end -= kSame;
  if (gap.cameraEnd == 0) return {{by_first, false, true}};
  if (gap.cameraBegin == 0) return {{by_second, false, true}};
  if (std::llabs(before - after) >= kJump) return {{by_first, false, true}, {by_second, true, true}};
  by_first.end = gap.cameraEnd - before - kSame;
  return {{by_first, false, true}};
}

bool lies_in(const SLibDEdgeStorageRecord& record, const CameraClock& clock) {
  const CutPlan& plan = clock.plan;
  return (record.end + 1) * kSecond - plan.offset > plan.begin - plan.uncertainty &&
         record.start * kSecond - plan.offset < plan.end + plan.uncertainty;
}

bool lies_in_one(const SLibDEdgeStorageRecord& record, const std::vector<Gap>& gaps, const BackfillOptions& options) {
  return std::any_of(gaps.begin(), gaps.end(), [&](const Gap& gap) {
    if (gap.end == 0) return false;
    const std::vector<CameraClock> clocks = clocks_of(gap, options);
    return std::any_of(clocks.begin(), clocks.end(),
                       [&record](const CameraClock& clock) { return lies_in(record, clock); });
  });
}

// A camera's list may have any number.
bool has_times(const SLibDEdgeStorageRecord& record) {
  constexpr std::int64_t kLatest = 100'000'000'000;  // seconds
  return record.start >= 0 && record.start <= record.end && record.end <= kLatest;
}

// Whether the camera's clock may have been right for a recording that was made since the card was listed. If not, a
// power failure had set it.
bool can_be_right(const SLibDEdgeStorageRecord& record, const CameraClock& clock, std::int64_t listed) {
  constexpr std::int64_t kHour = 3600 * kSecond;
  const std::int64_t start = record.start * kSecond - clock.plan.offset;
  return start > listed - kHour && start < clock.plan.end + kHour;
}

std::int64_t host_start(const PlannedRecording& planned) {
  return planned.record.start * kSecond - planned.plan.offset;
}

std::int64_t host_end(const PlannedRecording& planned) {
  return (planned.record.end + 1) * kSecond - planned.plan.offset;
}

}  // namespace

std::vector<PlannedRecording> plan_recordings(const Gap& gap, const CardView& card, const std::vector<Gap>& others,
                                              const BackfillOptions& options) {
  const std::vector<CameraClock> clocks = clocks_of(gap, options);
  std::vector<PlannedRecording> planned;
  std::vector<SLibDEdgeStorageRecord> unplaced;
  for (const SLibDEdgeStorageRecord& record : card.records) {
    if (!has_times(record)) continue;
    const bool is_fresh = card.fresh.count(record.streamName) != 0;
    // After each power failure the camera's clock shows the same times again.
    const auto clock = std::find_if(clocks.begin(), clocks.end(), [&](const CameraClock& of) {
      return lies_in(record, of) && (!of.has_jumped || is_fresh || card.listed == 0);
    });
    if (clock != clocks.end()) {
      planned.push_back({record, clock->plan, !clock->is_known});
    } else if (is_fresh && !can_be_right(record, clocks.front(), card.listed) &&
               !lies_in_one(record, others, options)) {
      unplaced.push_back(record);
    }
  }
  std::stable_sort(planned.begin(), planned.end(),
                   [](const PlannedRecording& a, const PlannedRecording& b) { return host_start(a) < host_start(b); });
  std::int64_t from = gap.begin;
  for (const PlannedRecording& before : planned) from = std::max(from, host_end(before));
  for (const SLibDEdgeStorageRecord& record : unplaced) {
    PlannedRecording last{record, {}, false};
    last.plan.begin = gap.begin;
    last.plan.end = gap.end;
    const std::int64_t length = (record.end + 1 - record.start) * kSecond;
    from = std::max(gap.begin, std::min(from, gap.end - length));
    last.plan.offset = record.start * kSecond - from - 1;
    planned.push_back(last);
    from = host_end(last);
  }
  return planned;
}

}  // namespace vexa
