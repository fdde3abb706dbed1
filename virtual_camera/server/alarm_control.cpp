// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/alarm_control.h"

#include <asio/buffer.hpp>
#include <asio/io_context.hpp>
#include <asio/read_until.hpp>
#include <asio/steady_timer.hpp>
#include <asio/write.hpp>
#include <utility>
#include <vector>

#include "virtual_camera/server/camera_state.h"
#include "virtual_camera/values/number_text.h"
#include "virtual_camera/wire/message.h"

namespace vexa::camera {
namespace {

constexpr std::size_t kLongestRequest = 4096;
constexpr std::chrono::seconds kVisitLimit{10};

std::vector<std::string_view> steps_of(std::string_view path) {
  std::vector<std::string_view> steps;
  while (path.starts_with('/')) {
    path.remove_prefix(1);
    steps.push_back(path.substr(0, path.find('/')));
    path.remove_prefix(steps.back().size());
  }
  return steps;
}

struct Switch {
  std::string_view name;
  AlarmEvent::Kind kind;
  std::string_view on;
  std::string_view off;
};

constexpr Switch kContact{"contact", AlarmEvent::Kind::kContact, "close", "open"};
constexpr Switch kSwitches[] = {{"lens", AlarmEvent::Kind::kLens, "cover", "free"},
                                {"noise", AlarmEvent::Kind::kNoise, "on", "off"}};

std::optional<AlarmEvent> switched(const Switch& by, std::string_view word, int number) {
  if (word != by.on && word != by.off) return std::nullopt;
  return AlarmEvent{by.kind, number, word == by.on ? 1 : 0};
}

std::optional<AlarmEvent> event_of(const std::vector<std::string_view>& steps) {
  for (const Switch& by : kSwitches) {
    if (steps.size() == 2 && steps[0] == by.name) return switched(by, steps[1], 1);
  }
  if (steps.size() != 3) return std::nullopt;
  const std::optional<int> number = whole_number(steps[1]);
  if (!number) return std::nullopt;
  if (steps[0] == kContact.name) return switched(kContact, steps[2], *number);
  const std::optional<int> value = whole_number(steps[2]);
  if (steps[0] != "motion" || !value) return std::nullopt;
  return AlarmEvent{AlarmEvent::Kind::kMotion, *number, *value};
}

}  // namespace

struct AlarmControl::Visit {
  explicit Visit(asio::ip::tcp::socket taken) : socket(std::move(taken)), limit(socket.get_executor()) {}

  asio::ip::tcp::socket socket;
  asio::steady_timer limit;
  std::string request;
};

std::optional<AlarmEvent> control_event(std::string_view path) { return event_of(steps_of(path)); }

std::optional<std::chrono::seconds> control_walk(std::string_view path) {
  constexpr std::chrono::seconds kUsual{10};
  constexpr int kLongest = 3600;
  const std::vector<std::string_view> steps = steps_of(path);
  if (steps.empty() || steps.size() > 2 || steps[0] != "walk") return std::nullopt;
  if (steps.size() == 1) return kUsual;
  const std::optional<int> seconds = whole_number(steps[1]);
  if (!seconds || *seconds < 1 || *seconds > kLongest) return std::nullopt;
  return std::chrono::seconds(*seconds);
}

AlarmControl::AlarmControl(std::shared_ptr<CameraState> state)
    : state_(std::move(state)), watch_(std::make_shared<IntruderWatch>(state_)) {}

asio::error_code AlarmControl::open(std::uint16_t port) {
  if (!listener_) {
    const auto take_visit = [weak = weak_from_this()](asio::ip::tcp::socket socket) {
      if (const std::shared_ptr<AlarmControl> self = weak.lock())
        self->take(std::make_shared<Visit>(std::move(socket)));
    };
    listener_ = std::make_shared<Listener>(state_->context, "127.0.0.1", take_visit);
  }
  return listener_->open(port);
}

void AlarmControl::close() {
  if (listener_) listener_->close();
  watch_->stop();
}

void AlarmControl::take(const std::shared_ptr<Visit>& visit) {
  visit->limit.expires_after(kVisitLimit);
  visit->limit.async_wait([visit](asio::error_code stopped) {
    asio::error_code ignored;
    if (!stopped) visit->socket.close(ignored);
  });
  asio::async_read_until(visit->socket, asio::dynamic_buffer(visit->request, kLongestRequest), "\r\n\r\n",
                         [self = shared_from_this(), visit](asio::error_code error, std::size_t) {
                           visit->limit.cancel();
                           if (error) return;
                           const std::string_view said = self->answer(visit->request);
                           asio::async_write(visit->socket, asio::buffer(said),
                                             [visit](asio::error_code, std::size_t) {});
                         });
}

std::string_view AlarmControl::answer(const std::string& request) {
  const std::optional<RequestHead> head = parse_head(request);
  if (head && (head->path == "/network/unplug" || head->path == "/network/plug")) {
    if (state_->requests.set_network) state_->requests.set_network(head->path == "/network/plug");
    return "HTTP/1.0 204 No Content\r\n\r\n";
  }
  if (const auto time = head ? control_walk(head->path) : std::nullopt) {
    const std::chrono::duration<double, std::milli> at_pace = *time / state_->options.speed;
    watch_->walk(std::chrono::duration_cast<std::chrono::milliseconds>(at_pace));
    return "HTTP/1.0 204 No Content\r\n\r\n";
  }
  const auto event = head ? control_event(head->path) : std::nullopt;
  if (!event) return "HTTP/1.0 404 Not Found\r\nContent-Length: 0\r\n\r\n";
  if (!state_->alarms.happen(*event)) return "HTTP/1.0 400 Bad Request\r\nContent-Length: 0\r\n\r\n";
  return "HTTP/1.0 204 No Content\r\n\r\n";
}

}  // namespace vexa::camera
