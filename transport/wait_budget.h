// Waiting for descriptors, with a budget.
#pragma once

#include <chrono>

namespace vexa {

/// A time-out that one or several waits share: made before a loop it is shared by the loop's waits, made inside it is
/// fresh for each. Each wait returns 1 (ready), 0 (the budget is used up) or -1 (errno has the reason); a signal does
/// not end it, and a budget of 0 or less does not wait. Uses poll, so that a descriptor may have any number.
class WaitBudget {
 public:
  explicit WaitBudget(int milliseconds);

  int wait_readable(int descriptor) const;
  int wait_writable(int descriptor) const;
  /// As wait_readable, and 0 at once when `stop` (which may be -1: none) becomes readable; its other
  /// conditions are ignored.
  int wait_readable_unless(int descriptor, int stop) const;

 private:
  int wait(int descriptor, short events, int stop) const;

  std::chrono::steady_clock::time_point deadline_;
};

}  // namespace vexa
