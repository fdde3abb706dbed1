// What ends waits from another thread, or from a signal handler.
#pragma once

#include <atomic>

namespace vexa {

/// Raised by any thread or signal handler, seen by every wait that was given it, until it is lowered. Where the system
/// has no descriptor left it is a flag, at which waits look every 50 ms. The descriptor is shared with a forked child.
class CancelSignal {
 public:
  CancelSignal();
  ~CancelSignal();
  CancelSignal(const CancelSignal&) = delete;
  CancelSignal& operator=(const CancelSignal&) = delete;

  /// Async-signal-safe; leaves errno.
  void raise();
  /// Async-signal-safe; leaves errno.
  void lower();
  bool is_raised() const;
  /// Readable while the signal is raised; -1 where there is none.
  int descriptor() const { return descriptor_; }

 private:
  int descriptor_;
  std::atomic<bool> raised_{false};  // counts only without a descriptor
};

/// What may end a wait early: what cancels the call that waits, what cancels all calls of several drivers, and the end
/// of the stream. The signals outlive the wait.
struct Cancels {
  const CancelSignal* call = nullptr;
  const CancelSignal* token = nullptr;
  int stop = -1;  ///< readable when the stream is to end; -1: never

  bool raised() const;
};

}  // namespace vexa
