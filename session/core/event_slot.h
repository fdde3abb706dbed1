// SPDX-License-Identifier: Apache-2.0
// The latest event of a session for a host that may be slow.
#pragma once

#include <cstdint>
#include <optional>

#include "vexa/session_status.h"

namespace vexa {

/// Numbers events and holds the latest one, whatever the host does: it never grows. A host that takes more slowly than
/// events come gets the latest, with how many it has missed.
class EventSlot {
 public:
  /// Gives the event its number, and replaces what was not taken.
  void put(SessionStatus status);
  /// The latest event that was not taken yet.
  std::optional<SessionStatus> take();
  /// The latest event, taken or not: the state when asked for.
  [[nodiscard]] const SessionStatus& latest() const { return latest_; }
  [[nodiscard]] bool has_news() const { return taken_ != latest_.event; }
  [[nodiscard]] std::uint64_t missed() const { return missed_; }  ///< in the session's life

 private:
  SessionStatus latest_;
  std::uint64_t taken_ = 0;  ///< number of the last event that was taken
  std::uint64_t missed_ = 0;
};

}  // namespace vexa
