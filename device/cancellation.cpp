#include "device/cancellation.h"

#include <utility>

namespace vexa {
void Cancellation::cancel() {
  std::shared_ptr<CancelSignal> waiting;
  {
    const Guard guard(lock_);
    ++count_;
    waiting = waiting_.lock();
    waiting_.reset();
  }
  if (waiting != nullptr) waiting->raise();
}

void Cancellation::use_token(std::shared_ptr<const CancelSignal> token) {
  const Guard guard(lock_);
  token_.swap(token);
}

CallEnds Cancellation::join(unsigned count) {
  const Guard guard(lock_);
  if (count != count_) {
    const auto past = std::make_shared<CancelSignal>();
    past->raise();
    return {past, token_};
  }
  std::shared_ptr<CancelSignal> signal = waiting_.lock();
  if (signal == nullptr) signal = std::make_shared<CancelSignal>();
  waiting_ = signal;
  return {std::move(signal), token_};
}

}  // namespace vexa
