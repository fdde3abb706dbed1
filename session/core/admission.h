// SPDX-License-Identifier: Apache-2.0
// Bounds how many sessions connect at the same time.
#pragma once

#include <cstddef>
#include <cstdint>
#include <deque>
#include <set>

namespace vexa {

/// First come, first served. A session is a number of its group's.
class Admission {
 public:
  explicit Admission(std::size_t most) : most_(most) {}

  /// Whether the session may connect now; otherwise it stands in the queue, once.
  bool enter(std::uint64_t session);
  /// The session has connected, has failed, or no longer wants to.
  void leave(std::uint64_t session);
  /// The first of the queue that may connect now, and is admitted by this; 0 when there is none.
  std::uint64_t admit_next();

  [[nodiscard]] std::size_t inside() const { return inside_.size(); }
  [[nodiscard]] std::size_t waiting() const { return queue_.size(); }

 private:
  const std::size_t most_;
  std::set<std::uint64_t> inside_;
  std::deque<std::uint64_t> queue_;
};

}  // namespace vexa
