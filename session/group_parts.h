// SPDX-License-Identifier: Apache-2.0
// What the sessions of a group share.
#pragma once

#include <atomic>
#include <cstdint>
#include <functional>
#include <mutex>
#include <utility>

#include "session/core/admission.h"
#include "session/job_pool.h"
#include "vexa/session.h"

namespace vexa {

/// Totals of a group's life. Any thread.
struct GroupCounts {
  std::atomic<std::uint64_t> wake_ups{0};
  std::atomic<std::uint64_t> longest_callback{0};  ///< microseconds
  std::atomic<std::uint64_t> attempts{0};
  std::atomic<std::uint64_t> most_at_once{0};
  std::atomic<std::uint64_t> events_missed{0};
  std::atomic<std::uint64_t> exceptions{0};
  std::atomic<std::uint64_t> most_turns_waited{0};
};

/// Raises a total that is a highest value.
inline void raise_to(std::atomic<std::uint64_t>& highest, std::uint64_t value) {
  std::uint64_t before = highest.load(std::memory_order_relaxed);
  while (before < value && !highest.compare_exchange_weak(before, value, std::memory_order_relaxed)) {
  }
}

/// Turns to connect, for sessions by their number in the group. Any thread.
class Turns {
 public:
  /// `wake` is called, with no lock held, for the session whose turn has come.
  Turns(std::size_t most, std::function<void(std::uint64_t)> wake) : admission_(most), wake_(std::move(wake)) {}

  [[nodiscard]] bool enter(std::uint64_t session, GroupCounts& counts) {
    const std::lock_guard<std::mutex> lock(mutex_);
    if (!admission_.enter(session)) {
      raise_to(counts.most_turns_waited, admission_.waiting());
      return false;
    }
    raise_to(counts.most_at_once, admission_.inside());
    return true;
  }
  void leave(std::uint64_t session) {
    std::uint64_t next = 0;
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      admission_.leave(session);
      next = admission_.admit_next();
    }
    if (next != 0) wake_(next);
  }

 private:
  std::mutex mutex_;
  Admission admission_;
  const std::function<void(std::uint64_t)> wake_;
};

/// Outlives the sessions of the group.
struct GroupParts {
  GroupParts(std::size_t attempts, bool threads, std::function<void(std::uint64_t)> wake_session)
      : has_threads(threads),
        turns(attempts, std::move(wake_session)),
        connectors(attempts),
        sides(attempts),
        closers(2) {}

  const bool has_threads;  ///< that call the host
  GroupCounts counts;
  Turns turns;
  JobPool connectors;
  JobPool sides;  ///< for jobs beside streams that run
  JobPool closers;
};

}  // namespace vexa
