// SPDX-License-Identifier: Apache-2.0
#include "node/segments/retention.h"

#include <algorithm>
#include <numeric>

namespace vexa::node {

std::vector<std::size_t> segments_to_remove(const std::vector<StoredSegment>& segments, const RetentionRules& rules,
                                            std::chrono::milliseconds now) {
  std::vector<std::size_t> oldest(segments.size());
  std::iota(oldest.begin(), oldest.end(), std::size_t{0});
  std::stable_sort(oldest.begin(), oldest.end(),
                   [&](std::size_t a, std::size_t b) { return segments[a].start < segments[b].start; });
  std::uint64_t bytes = 0;
  for (const StoredSegment& segment : segments) bytes += segment.bytes;
  const bool is_full = rules.high_bytes && bytes > *rules.high_bytes;
  std::vector<std::size_t> removed;
  for (const std::size_t i : oldest) {
    const bool is_old = rules.age && now - segments[i].start > *rules.age;
    if (segments[i].is_open || !(is_old || (is_full && bytes > rules.low_bytes))) continue;
    removed.push_back(i);
    bytes -= segments[i].bytes;
  }
  return removed;
}

}  // namespace vexa::node
