// SPDX-License-Identifier: Apache-2.0
#include "session/core/event_slot.h"

#include <utility>

namespace vexa {

void EventSlot::put(SessionStatus status) {
  status.event = latest_.event + 1;
  status.missed = 0;
  latest_ = std::move(status);
}

std::optional<SessionStatus> EventSlot::take() {
  if (!has_news()) return std::nullopt;
  SessionStatus status = latest_;
  status.missed = latest_.event - taken_ - 1;
  missed_ += status.missed;
  taken_ = latest_.event;
  return status;
}

}  // namespace vexa
