// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/intruder_watch.h"

#include <utility>

#include "virtual_camera/server/camera_state.h"

namespace vexa::camera {

IntruderWatch::IntruderWatch(std::shared_ptr<CameraState> state) : state_(std::move(state)), pace_(state_->context) {}

void IntruderWatch::walk(std::chrono::milliseconds duration) {
  const auto now = std::chrono::steady_clock::now();
  state_->stage.enter(walk_through(state_->scene.main_view(now), duration), now);
  check();
}

void IntruderWatch::stop() {
  pace_.cancel();
  state_->stage.enter({}, {});
  report({});
}

void IntruderWatch::report(const std::array<bool, kDetectionWindows>& seen) {
  constexpr int kMovement = 60;
  for (std::size_t i = 0; i < seen.size(); ++i) {
    if (std::exchange(seen_[i], seen[i]) == seen[i]) continue;
    state_->alarms.happen({AlarmEvent::Kind::kMotion, static_cast<int>(i) + 1, seen[i] ? kMovement : 0});
  }
}

void IntruderWatch::check() {
  constexpr std::chrono::milliseconds kInterval{20};
  const auto now = std::chrono::steady_clock::now();
  report(state_->scene.alarmed_windows(now));
  if (!state_->stage.intruder(now)) return;
  pace_.expires_after(kInterval);
  pace_.async_wait([self = shared_from_this()](asio::error_code stopped) {
    if (!stopped) self->check();
  });
}

}  // namespace vexa::camera
