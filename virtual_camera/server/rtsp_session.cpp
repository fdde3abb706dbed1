// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/rtsp_session.h"

#include <optional>
#include <utility>

#include "virtual_camera/server/camera_state.h"

namespace vexa::camera {
namespace {

// Makes the seeds of a camera's sessions differ; the first session has the camera's own.
constexpr std::uint64_t kSeedStep = 0x9E3779B97F4A7C15ULL;

}  // namespace

RtspSession::RtspSession(std::shared_ptr<CameraState> state, std::uint32_t number, int video,
                         std::unique_ptr<PacketPort> port, std::chrono::milliseconds pause)
    : state_(std::move(state)),
      number_(number),
      video_(video),
      sender_(std::make_shared<RtpSender>(state_->context,
                                          std::shared_ptr<const CameraOptions>(state_, &state_->options),
                                          std::shared_ptr<SentLog>(state_, &state_->sent), number, std::move(port))),
      pause_(pause),
      expiry_(state_->context) {}

void RtspSession::play() {
  if (!sender_->may_play()) return;
  RtpSender::Play play;
  play.source = std::move(source_);
  if (!play.source) {
    std::optional<StreamPlan> plan = state_->sources.plan(video_);
    if (plan) play.source = std::move(plan->source);
  }
  if (!play.source) return;
  play.user_data = [state = state_] { return state->sources.present_user_data(); };
  play.faults = state_->packet_faults.get();
  play.seed = state_->options.seed + kSeedStep * state_->plays++;
  play.pause = pause_;
  play.now = state_->wall_clock();
  sender_->play(std::move(play));
}

void RtspSession::touch() {
  if (state_->options.session_expiry == SessionExpiry::kNever) return;
  expiry_.expires_after(state_->options.session_timeout);
  expiry_.async_wait([self = shared_from_this()](asio::error_code error) {
    const bool moved = self->expiry_.expiry() > std::chrono::steady_clock::now();
    if (!error && !moved) self->end();
  });
}

void RtspSession::end() {
  const std::shared_ptr<RtspSession> keep = shared_from_this();
  expiry_.cancel();
  sender_->stop();
  state_->sessions.erase(number_);
}

}  // namespace vexa::camera
