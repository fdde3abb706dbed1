// Waiting for descriptors, with a budget.
#pragma once

#include <chrono>

#include "transport/cancel_signal.h"

namespace vexa {

/// How long a wait may take, and what ends it before. A wait that is cancelled ends as one whose time is over.
struct WaitLimit {
  WaitLimit(int time) : milliseconds(time) {}  // NOLINT(google-explicit-constructor): a wait that nothing cancels
  WaitLimit(int time, Cancels ends) : milliseconds(time), cancels(ends) {}

  /// Another time, with the same cancels.
  WaitLimit of(int time) const { return {time, cancels}; }

  int milliseconds;
  Cancels cancels{};
};

/// Milliseconds that one or several waits share: made before a loop it is shared by the loop's waits, made inside it is
/// fresh for each. Every wait answers 1 (ready), 0 (the budget is used up, or the wait is cancelled) or -1 (errno says
/// why); a signal does not end it, and a budget of 0 or less looks once. Waits by poll, so that any number of a
/// descriptor will do.
/// A value on the stack of the thread that waits; it holds no descriptor.
class WaitBudget {
 public:
  explicit WaitBudget(WaitLimit limit);

  int wait_readable(int descriptor) const;
  int wait_writable(int descriptor) const;
  /// As wait_readable, and 0 at once when `stop` (which may be -1: none) becomes readable; its other conditions are
  /// passed over.
  int wait_readable_unless(int descriptor, int stop) const;
  /// Waits until the peer has closed or reset the connection (1), so that no answer can come any more, or until the
  /// budget is used up (0). Data that are there do not end it.
  int wait_closed(int descriptor) const;
  /// Waits for nothing but the time and the cancels.
  void pause() const;

 private:
  int wait(int descriptor, short events, int stop) const;
  int wait_for(int descriptor, short events, int stop) const;

  std::chrono::steady_clock::time_point deadline_;
  Cancels cancels_;
};

}  // namespace vexa
