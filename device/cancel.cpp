// The cancels that hosts use.
#include "vexa/cancel.h"

#include "device/driver_state.h"

namespace vexa {

void Cancel(CVexaCommon& driver) noexcept { DriverState::of(driver).cancellation.cancel(); }

CancelToken::CancelToken() : signal_(std::make_shared<CancelSignal>()) {}

CancelToken::~CancelToken() = default;

void CancelToken::Cancel() noexcept { signal_->raise(); }

void CancelToken::Reset() noexcept { signal_->lower(); }

bool CancelToken::IsCancelled() const noexcept { return signal_->is_raised(); }

void SetCancelToken(CVexaCommon& driver, const CancelToken& token) noexcept {
  DriverState::of(driver).cancellation.use_token(token.signal_);
}

void RemoveCancelToken(CVexaCommon& driver) noexcept { DriverState::of(driver).cancellation.use_token(nullptr); }

}  // namespace vexa
