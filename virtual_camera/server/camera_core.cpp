// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/camera_core.h"

#include <fmt/format.h>

#include <asio/io_context.hpp>
#include <asio/post.hpp>
#include <cstddef>
#include <mutex>
#include <utility>
#include <vector>

#include "virtual_camera/codec/rtp_packetiser.h"
#include "virtual_camera/server/http_connection.h"
#include "virtual_camera/server/rtsp_connection.h"

namespace vexa::camera {
namespace {

// Far above what well-behaved hosts open at once; more connections are closed at once.
constexpr std::size_t kMaxConnections = 512;

void keep(std::vector<std::weak_ptr<Connection>>& connections, const std::shared_ptr<Connection>& connection) {
  std::erase_if(connections, [](const std::weak_ptr<Connection>& other) { return other.expired(); });
  if (connections.size() >= kMaxConnections) return;
  connections.push_back(connection);
  connection->start();
}

template <typename Kind>
std::shared_ptr<Listener> listener_of(const std::shared_ptr<CameraState>& state) {
  return std::make_shared<Listener>(state->context, state->options.address, [state](asio::ip::tcp::socket socket) {
    keep(state->connections, std::make_shared<Kind>(std::move(socket), state));
  });
}

std::string bind_failure(const std::string& address, std::uint16_t port, const asio::error_code& error) {
  std::string text = fmt::format("cannot listen on {}:{}: {}", address, port, error.message());
  if (error == asio::error::access_denied) {
    text +=
        "; ports below 1024 need root: run as root, or in a namespace of your own (unshare -rn, then "
        "\"ip link set lo up\"), or choose other ports (--http-port, --rtsp-port)";
  }
  return text;
}

}  // namespace

// Parts of the alarm-data stream, queued for the loop's thread. Any thread adds them, the loop's takes them.
class CameraCore::AlarmParts {
 public:
  void add(const std::string& part) {
    const std::lock_guard<std::mutex> lock(mutex_);
    parts_.push_back(part);
  }
  [[nodiscard]] std::deque<std::string> take() {
    const std::lock_guard<std::mutex> lock(mutex_);
    return std::exchange(parts_, {});
  }

 private:
  std::mutex mutex_;
  std::deque<std::string> parts_;
};

CameraCore::CameraCore(std::shared_ptr<CameraState> state)
    : state_(std::move(state)),
      http_(listener_of<HttpConnection>(state_)),
      rtsp_(listener_of<RtspConnection>(state_)),
      control_(std::make_shared<CameraControl>(state_)),
      control_port_(std::make_shared<ControlPort>(
          state_->context, [control = control_](const RequestHead& request) { return control->answer(request); })),
      recorder_(std::make_shared<CardRecorder>(state_)),
      back_(state_->context) {}

std::string CameraCore::open_ports() {
  const CameraOptions& options = state_->options;
  if (const asio::error_code error = http_->open(options.http_port)) {
    return bind_failure(options.address, options.http_port, error);
  }
  if (const asio::error_code error = rtsp_->open(options.rtsp_port)) {
    http_->close();
    return bind_failure(options.address, options.rtsp_port, error);
  }
  return {};
}

std::string CameraCore::prepare() {
  if (!state_->profile_error.empty()) return state_->profile_error;
  CameraOptions& options = state_->options;
  const bool rates_stand =
      options.frames_per_second > 0 && options.speed > 0 && options.ptz_speed > 0 && options.clock_rate > 0;
  if (!rates_stand) return "frames per second, speed, PTZ speed and clock rate must be above 0";
  if (options.max_payload < 3 || options.burst_packets == 0) return "too small a packet or burst";
  if (!options.images && !options.image_path.empty()) {
    options.images = ImageClip::load(options.image_path);
    if (!options.images) return fmt::format("no pictures in {}", options.image_path);
  }
  if (options.clip || options.clip_path.empty()) return {};
  options.clip = PacketisedClip::load(options.clip_path, options.max_payload, options.user_data);
  return options.clip ? "" : fmt::format("no pictures in {}", options.clip_path);
}

std::string CameraCore::start() {
  if (running_) return {};
  std::string failure = prepare();
  if (failure.empty()) failure = open_ports();
  if (!failure.empty()) return failure;
  if (state_->options.control) {
    if (const asio::error_code error = control_port_->open(state_->options.control_port)) {
      vanish();
      return bind_failure("127.0.0.1", state_->options.control_port, error);
    }
  }
  running_ = true;
  spread_alarms();
  take_calls();
  return {};
}

// What its connections and the control port may ask for while it runs.
void CameraCore::take_calls() {
  state_->requests.reboot = [weak = weak_from_this()](std::chrono::milliseconds away) {
    if (const std::shared_ptr<CameraCore> core = weak.lock()) core->reboot(away);
  };
  state_->requests.set_network = [weak = weak_from_this()](bool plugged) {
    if (const std::shared_ptr<CameraCore> core = weak.lock()) core->set_network(plugged);
  };
  state_->requests.settings_changed = [weak = std::weak_ptr<CardRecorder>(recorder_)] {
    if (const std::shared_ptr<CardRecorder> recorder = weak.lock()) recorder->update();
  };
}

// Changes may come from any thread; the connections live on the loop's. They wait in a queue of their own, because what
// the loop's thread posts and what others post overtake each other.
void CameraCore::spread_alarms() {
  const auto parts = std::make_shared<AlarmParts>();
  state_->alarm_part =
      state_->alarms.listen([weak = weak_from_this(), parts, &context = state_->context](const std::string& part) {
        parts->add(part);
        asio::post(context, [weak, parts] {
          if (const std::shared_ptr<CameraCore> core = weak.lock()) core->send_alarm_parts(parts->take());
        });
      });
}

void CameraCore::send_alarm_parts(const std::deque<std::string>& parts) {
  for (const std::string& part : parts) {
    state_->alarm_part = part;
    for (const std::weak_ptr<Connection>& connection : state_->connections) {
      if (const std::shared_ptr<Connection> open = connection.lock()) open->take_alarm(part);
    }
  }
}

void CameraCore::vanish() {
  http_->close();
  rtsp_->close();
  for (const std::weak_ptr<Connection>& weak : std::exchange(state_->connections, {})) {
    if (const std::shared_ptr<Connection> connection = weak.lock()) connection->reset();
  }
}

void CameraCore::stop() {
  running_ = false;
  state_->requests = {};
  plugged_ = true;
  recorder_->set_reachable(true);
  recorder_->stop();
  back_.cancel();
  state_->alarms.listen(nullptr);
  control_port_->close();
  control_->stop();
  vanish();
}

void CameraCore::reboot(std::chrono::milliseconds away) {
  if (!running_) return;
  recorder_->stop();
  vanish_for(away);
}

void CameraCore::vanish_for(std::chrono::milliseconds away) {
  vanish();
  back_.expires_after(away);
  back_.async_wait([self = shared_from_this()](asio::error_code error) {
    if (!error && self->running_) self->come_back();
  });
}

void CameraCore::come_back() {
  constexpr std::chrono::milliseconds kRetry{50};
  recorder_->update();
  if (plugged_ && !open_ports().empty()) vanish_for(kRetry);
}

void CameraCore::set_network(bool plugged) {
  if (!running_ || plugged == plugged_) return;
  plugged_ = plugged;
  recorder_->set_reachable(plugged_);
  back_.cancel();
  vanish();
  if (plugged_) come_back();
}

}  // namespace vexa::camera
