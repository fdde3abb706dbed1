// SPDX-License-Identifier: Apache-2.0
// Where a driver's events go while somebody wants them: the trace file of the environment, and the flight record.
#pragma once

#include <array>
#include <atomic>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "runtime/base/published.h"
#include "runtime/base/sync.h"
#include "transport/socket.h"

namespace vexa {

class Connection;

/// The latest lines. One thread at a time adds, any thread reads without a lock, in a signal handler too.
class FlightRing {
 public:
  static constexpr std::uint32_t kLines = 1000;
  static constexpr std::size_t kLineRoom = 240;

  void add(std::string_view line);

  /// Hands each line, the oldest first, to `use`; not one that is being written.
  template <typename Use>
  void visit(Use&& use) const {
    const std::uint32_t end = end_.load(std::memory_order_acquire);
    const std::uint32_t begin = end < kLines ? 0 : end - kLines;
    for (std::uint32_t i = begin; i != end; ++i) {
      Line line;
      if (lines_[i % kLines].try_read(line)) use(std::string_view(line.text, static_cast<std::size_t>(line.length)));
    }
  }

 private:
  struct Line {
    std::uint64_t length;
    char text[kLineRoom];
  };

  std::array<Published<Line>, kLines> lines_;
  std::atomic<std::uint32_t> end_{0};  // of the lines; below twice kLines
};

/// Owned by DriverState; any thread. Costs a test of a flag while nobody wants events. Never fails: an event that
/// memory is too short for, or that cannot be written, is lost.
class FlightRecorder {
 public:
  /// Opens the file that VEXA_TRACE names, if it is set. `connection` outlives the recorder.
  explicit FlightRecorder(Connection& connection);
  ~FlightRecorder();
  FlightRecorder(const FlightRecorder&) = delete;
  FlightRecorder& operator=(const FlightRecorder&) = delete;

  bool is_on() const { return on_.load(std::memory_order_relaxed); }
  /// One event, with the connection's password masked. No lock that comes after the connection's may be held.
  void note(const char* kind, std::string_view event) VEXA_EXCLUDES(lock_);

  /// False when memory is short.
  bool begin_record() VEXA_EXCLUDES(lock_);
  void end_record() VEXA_EXCLUDES(lock_);
  std::vector<std::string> record() VEXA_EXCLUDES(lock_);

 private:
  std::string line_of(const char* kind, std::string_view event);

  Connection& connection_;
  const unsigned number_;
  const Socket file_;  ///< closed like any descriptor
  std::atomic<bool> on_;
  CSimpleLock lock_;
  std::unique_ptr<FlightRing> ring_ VEXA_GUARDED_BY(lock_);
};

}  // namespace vexa
