// How much of a block recent uses have needed.
#pragma once

#include <algorithm>
#include <cstddef>
#include <optional>
#include <utility>

namespace vexa {

/// For blocks that are filled from their start again and again, and whose memory stays in hand between two uses. When
/// kPeriod uses in a row needed far less than was touched before, the rest can be given back.
class RecentNeed {
 public:
  static constexpr unsigned kPeriod = 128;         ///< pictures, a key picture among them on most streams
  static constexpr std::size_t kLittle = 1 << 16;  ///< bytes that are not worth a system call

  /// A use filled the block's first `bytes`. The bytes at its start that are still needed, when the rest can go.
  std::optional<std::size_t> used(std::size_t bytes) {
    largest_ = std::max(largest_, bytes);
    touched_ = std::max(touched_, bytes);
    if (++uses_ < kPeriod) return std::nullopt;
    uses_ = 0;
    const std::size_t needed = std::exchange(largest_, 0);
    if (touched_ < 2 * needed + kLittle) return std::nullopt;
    touched_ = needed;
    return needed;
  }

 private:
  std::size_t largest_ = 0;  // of this period
  std::size_t touched_ = 0;  // since the rest was last given back
  unsigned uses_ = 0;
};

}  // namespace vexa
