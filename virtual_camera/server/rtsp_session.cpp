#include "virtual_camera/server/rtsp_session.h"

#include <utility>

namespace vexa::camera {

RtspSession::RtspSession(std::shared_ptr<CameraState> state, std::uint32_t number, int video,
                         std::unique_ptr<PacketPort> port, std::chrono::milliseconds pause)
    : state_(std::move(state)),
      number_(number),
      sender_(std::make_shared<RtpSender>(state_, number, video, std::move(port))),
      pause_(pause),
      expiry_(state_->context) {}

void RtspSession::play() { source_ ? sender_->play(std::move(source_), pause_) : sender_->play(pause_); }

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
