// What ends the calls that wait in a driver.
#pragma once

#include <atomic>
#include <memory>

#include "runtime/base/sync.h"
#include "transport/cancel_signal.h"

namespace vexa {

/// What may end one call, as long as the call.
struct CallEnds {
  std::shared_ptr<const CancelSignal> call;
  std::shared_ptr<const CancelSignal> token;

  Cancels view() const { return {call.get(), token.get()}; }
};

/// The cancels of one driver. A call that is about to wait joins the signal of all calls that wait; a cancel raises it
/// and leaves a new one to the calls that come. A driver in which no call waits has no descriptor here. Any thread.
class Cancellation {
 public:
  /// Ends the calls that have begun.
  void cancel();
  void use_token(std::shared_ptr<const CancelSignal> token);
  /// How many cancels there have been when a call begins.
  unsigned count() const { return count_; }
  /// What ends a call that began after `count` cancels.
  CallEnds join(unsigned count);

 private:
  CSimpleLock lock_;
  std::atomic<unsigned> count_{0};  // changed under the lock
  std::weak_ptr<CancelSignal> waiting_ VEXA_GUARDED_BY(lock_);
  std::shared_ptr<const CancelSignal> token_ VEXA_GUARDED_BY(lock_);
};

}  // namespace vexa
