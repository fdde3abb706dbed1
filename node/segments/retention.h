// SPDX-License-Identifier: Apache-2.0
// Which segments have to go.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <vector>

namespace vexa::node {

struct RetentionRules {
  std::optional<std::chrono::seconds> age = {};  ///< older ones go
  std::optional<std::uint64_t> high_bytes = {};  ///< when there are more, the oldest go until there are `low_bytes`
  std::uint64_t low_bytes = 0;                   ///< at most high_bytes
};

struct StoredSegment {
  std::chrono::milliseconds start{0};  ///< since 1970
  std::uint64_t bytes = 0;
  bool is_open = false;  ///< being written: counts and stays
};

/// Indices of those that go, oldest first.
[[nodiscard]] std::vector<std::size_t> segments_to_remove(const std::vector<StoredSegment>& segments,
                                                          const RetentionRules& rules, std::chrono::milliseconds now);

}  // namespace vexa::node
