// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/http_connection.h"

#include <asio/io_context.hpp>
#include <asio/post.hpp>
#include <chrono>
#include <optional>
#include <utility>

#include "virtual_camera/server/alarm_feed.h"
#include "virtual_camera/server/camera_state.h"
#include "virtual_camera/server/http_commands.h"
#include "virtual_camera/server/media_stream.h"
#include "virtual_camera/values/number_text.h"
#include "virtual_camera/wire/message.h"

namespace vexa::camera {
namespace {

using State = std::shared_ptr<CameraState>;
using Body = std::shared_ptr<HttpBody>;

constexpr std::string_view kImages = "/image";

std::shared_ptr<AlarmFeed> open_feed(const RequestHead& head, const State& state, AlarmFeed::Changes changes,
                                     std::function<std::string()> present) {
  const std::chrono::duration<double> interval = feed_interval(head.query);
  switch_detectors(state->settings, state->alarms);
  return std::make_shared<AlarmFeed>(
      state->context, std::chrono::duration_cast<HttpBody::Clock::duration>(interval / state->options.speed), changes,
      std::move(present));
}

Body open_alarms(const RequestHead& head, const State& state) {
  return open_feed(head, state, AlarmFeed::Changes::kSentAtOnce, [state] { return state->alarm_part; });
}

Body open_metadata(const RequestHead& head, const State& state) {
  return open_feed(head, state, AlarmFeed::Changes::kLeftOut, [state] { return state->alarms.metadata_part(); });
}

Body open_sound(const RequestHead&, const State& state) { return open_sound_stream(state); }

// "/imageN"; null for a path whose end is no number.
Body open_images(const RequestHead& head, const State& state) {
  const std::string_view digits = std::string_view(head.path).substr(kImages.size());
  const std::optional<int> number = whole_number(digits);
  if (!number || digits.front() == '-') return nullptr;
  Body stream = open_image_stream(state, *number);
  if (stream) state->picture_streams.push_back(stream);
  return stream;
}

enum class Match { kPath, kStem };

// The paths whose answers are streams. Where a body is null, the request is answered as a command.
constexpr struct {
  Match match;
  std::string_view path;
  Body (*open)(const RequestHead& head, const State& state);
} kStreams[] = {{Match::kStem, kImages, open_images},
                {Match::kPath, "/audio", open_sound},
                {Match::kPath, "/command/alarmdata.cgi", open_alarms},
                {Match::kPath, "/mddata.cgi", open_metadata}};

Body open_body(const RequestHead& head, const State& state) {
  for (const auto& row : kStreams) {
    const bool named = row.match == Match::kStem ? head.path.starts_with(row.path) : head.path == row.path;
    if (named) return row.open(head, state);
  }
  return nullptr;
}

}  // namespace

std::size_t HttpConnection::request_size(std::string_view received) const { return head_size(received); }

Answer HttpConnection::answer(const std::string& request) {
  const std::optional<RequestHead> head = parse_head(request);
  if (!head) return http_answer("400 Bad Request", "");
  if (!state().lets_in(head->field("Authorization"))) return http_answer("401 Unauthorized", "");
  const bool full = state().viewers() >= state().options.max_viewers;
  if (full && head->path.starts_with(kImages)) return http_answer("503 Service Unavailable", "");
  body_ = open_body(*head, shared_state());
  return body_ ? Answer{200, body_->head()} : obey_command(*head, state());
}

Answer HttpConnection::refuse(const std::string&, std::string_view status) const { return http_answer(status, ""); }

void HttpConnection::take_alarm(const std::string& part) {
  if (body_) body_->take_alarm(part);
}

void HttpConnection::send_at(HttpBody::Clock::time_point time, std::function<std::string()> make) {
  Connection::send_at(time, std::move(make));
}

std::function<void()> HttpConnection::waker() {
  return [weak = weak_from_this(), &context = state().context, this] {
    asio::post(context, [weak, this] {
      const std::shared_ptr<Connection> self = weak.lock();
      if (self && body_) body_->go_on(*this);
    });
  };
}

}  // namespace vexa::camera
