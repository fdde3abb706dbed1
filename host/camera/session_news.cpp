// SPDX-License-Identifier: Apache-2.0
#include "host/camera/session_news.h"

#include <fmt/format.h>

#include <chrono>

#include "host/base/printable.h"

namespace vexa::host {

void SessionNews::show(const std::string& camera, const SessionStatus& status) {
  const bool live = status.state == SessionState::kLive;
  const bool passing = status.state == SessionState::kConnecting || status.state == SessionState::kStopped ||
                       status.cause == SessionCause::kTurn;
  if (passing || (live && away_.count(camera) == 0)) return;
  if (live) {
    away_.erase(camera);
  } else {
    away_.insert(camera);
  }
  if (!budget_.take(std::chrono::steady_clock::now())) return;
  terminal_.say(fmt::format("{}: {}", camera, printable(status.why)));
}

}  // namespace vexa::host
