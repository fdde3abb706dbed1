// SPDX-License-Identifier: Apache-2.0
#include "host/serve/wall.h"

#include <fmt/format.h>

#include <algorithm>
#include <cmath>
#include <nlohmann/json.hpp>
#include <utility>

#include "host/words/session_words.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;

constexpr std::int64_t kRateWindow = 5000;  // milliseconds
constexpr std::size_t kMostArrivals = 1000;

std::string text_of(const Json& json) { return json.dump(-1, ' ', false, Json::error_handler_t::replace); }

Json described(const WallCamera& camera, std::int64_t now) {
  const auto age = camera.age(now);
  return {{"name", camera.name()},
          {"state", word_of(camera.state())},
          {"why", camera.why()},
          {"ageMilliseconds", age ? Json(*age) : Json(nullptr)},
          {"stale", camera.stale(now)},
          {"hasPicture", camera.picture() != nullptr},
          {"picturesPerSecond", std::round(camera.rate(now) * 10) / 10},
          {"pictures", camera.pictures()},
          {"bytes", camera.bytes()},
          {"interruptions", camera.interruptions()},
          {"attempt", camera.attempt()}};
}

// A label's value: backslash, quote and line feed are escaped, other control characters left out.
std::string label(std::string_view text) {
  std::string escaped;
  for (const char c : text) {
    if (c == '\n') {
      escaped += "\\n";
    } else if (c == '"' || c == '\\') {
      escaped += '\\';
      escaped += c;
    } else if (static_cast<unsigned char>(c) >= ' ' && c != '\x7f') {
      escaped += c;
    }
  }
  // What is not UTF-8 becomes the replacement character, as in JSON.
  return Json::parse(text_of(escaped)).get<std::string>();
}

// The text of both formats; they differ in a counter's family name and in the end.
class MetricsText {
 public:
  explicit MetricsText(Wall::MetricsFormat format) : open_(format == Wall::MetricsFormat::kOpenMetrics) {}

  void family(std::string_view name, std::string_view type, std::string_view help) {
    const bool counter = type == "counter";
    name_ = counter ? fmt::format("{}_total", name) : std::string(name);
    const std::string_view shown = open_ ? name : std::string_view(name_);
    text_ += fmt::format("# HELP {0} {2}\n# TYPE {0} {1}\n", shown, type, help);
  }
  void sample(double value) { text_ += fmt::format("{} {}\n", name_, value); }
  void sample(std::string_view label_name, std::string_view label_value, double value) {
    text_ += fmt::format("{}{{{}=\"{}\"}} {}\n", name_, label_name, label(label_value), value);
  }
  [[nodiscard]] std::string take() { return std::move(text_) + (open_ ? "# EOF\n" : ""); }

 private:
  const bool open_;
  std::string name_;
  std::string text_;
};

}  // namespace

bool is_stale(std::int64_t age, std::int64_t interval) {
  constexpr std::int64_t kLeast = 2000;
  return age > std::max(kLeast, 2 * interval);
}

void WallCamera::take_status(const SessionStatus& status) {
  if (state_ == SessionState::kLive && status.state != SessionState::kLive) ++interruptions_;
  state_ = status.state;
  why_ = status.why;
  attempt_ = status.attempt;
}

void WallCamera::take_frame(const SessionFrame& frame, bool is_jpeg, std::int64_t wall_clock) {
  ++pictures_;
  bytes_ += frame.length;
  interval_ = latest_ > 0 && !frame.isFirst ? std::max<std::int64_t>(frame.arrival - latest_, 0) : 0;
  latest_ = frame.arrival;
  last_wall_clock_ = wall_clock;
  recent_.push_back(frame.arrival);
  while (recent_.size() > kMostArrivals || recent_.front() < frame.arrival - kRateWindow) recent_.pop_front();
  if (!is_jpeg || frame.data == nullptr) return;
  picture_ = std::make_shared<const std::string>(reinterpret_cast<const char*>(frame.data), frame.length);
  ++picture_number_;
}

double WallCamera::rate(std::int64_t now) const {
  const auto first =
      std::find_if(recent_.begin(), recent_.end(), [&](std::int64_t at) { return at > now - kRateWindow; });
  return static_cast<double>(recent_.end() - first) * 1000 / static_cast<double>(kRateWindow);
}

std::optional<std::int64_t> WallCamera::age(std::int64_t now) const {
  return pictures_ == 0 ? std::nullopt : std::optional(std::max<std::int64_t>(now - latest_, 0));
}

bool WallCamera::stale(std::int64_t now) const {
  const auto old = age(now);
  return !old || is_stale(*old, interval_);
}

WallCamera& Wall::add(std::string name) {
  return *cameras_.emplace_back(std::make_unique<WallCamera>(std::move(name)));
}

std::optional<std::size_t> Wall::find(std::string_view name) const {
  const auto found =
      std::find_if(cameras_.begin(), cameras_.end(), [&](const auto& one) { return one->name() == name; });
  return found == cameras_.end() ? std::nullopt : std::optional(static_cast<std::size_t>(found - cameras_.begin()));
}

bool Wall::ready() const {
  const auto tried = [](const auto& one) {
    return one->state() != SessionState::kIdle && (one->state() != SessionState::kConnecting || one->attempt() > 1);
  };
  return std::all_of(cameras_.begin(), cameras_.end(), tried);
}

std::string Wall::states(std::int64_t now) const {
  Json list = Json::array();
  for (const auto& camera : cameras_) list.push_back(described(*camera, now));
  return text_of({{"cameras", std::move(list)}});
}

std::string Wall::state_of(const WallCamera& camera, std::int64_t now) { return text_of(described(camera, now)); }

std::string Wall::metrics(MetricsFormat format, const ServeCounts& counts, std::string_view version) const {
  MetricsText text(format);
  text.family("vexa_build_info", "gauge", "The version of vexactl.");
  text.sample("version", version, 1);
  const auto each = [&](std::string_view name, std::string_view type, std::string_view help, auto value) {
    text.family(name, type, help);
    for (const auto& camera : cameras_) text.sample("camera", camera->name(), static_cast<double>(value(*camera)));
  };
  each("vexa_camera_live", "gauge", "1 while whole pictures come.",
       [](const WallCamera& camera) { return camera.state() == SessionState::kLive ? 1 : 0; });
  each("vexa_camera_pictures", "counter", "Pictures taken from the camera.",
       [](const WallCamera& camera) { return camera.pictures(); });
  each("vexa_camera_received_bytes", "counter", "Bytes of these pictures.",
       [](const WallCamera& camera) { return camera.bytes(); });
  each("vexa_camera_interruptions", "counter", "How often a live camera stopped being live.",
       [](const WallCamera& camera) { return camera.interruptions(); });
  each("vexa_camera_last_picture_timestamp_seconds", "gauge", "When the latest picture came; 0 before the first.",
       [](const WallCamera& camera) { return static_cast<double>(camera.last_picture_time()) / 1000; });
  const auto one = [&](std::string_view name, std::string_view type, std::string_view help, auto value) {
    text.family(name, type, help);
    text.sample(static_cast<double>(value));
  };
  one("vexa_serve_viewers", "gauge", "Pages and streams that are watched now.", counts.viewers);
  one("vexa_serve_connections", "counter", "Connections taken.", counts.connections);
  one("vexa_serve_refused_requests", "counter", "Requests that were not let in.", counts.refused);
  one("vexa_serve_pictures_sent", "counter", "Pictures sent to viewers.", counts.pictures_sent);
  one("vexa_serve_video_fragments_sent", "counter", "Pictures of H.264 sent to viewers.", counts.fragments_sent);
  one("vexa_serve_video_fragments_missed", "counter", "Pictures of H.264 that slow viewers missed.",
      counts.fragments_missed);
  return text.take();
}

Wall::MetricsFormat metrics_format(std::string_view accept) {
  return accept.find("application/openmetrics-text") != std::string_view::npos ? Wall::MetricsFormat::kOpenMetrics
                                                                               : Wall::MetricsFormat::kPrometheus;
}

std::string_view metrics_type(Wall::MetricsFormat format) {
  return format == Wall::MetricsFormat::kOpenMetrics ? "application/openmetrics-text; version=1.0.0; charset=utf-8"
                                                     : "text/plain; version=0.0.4; charset=utf-8";
}

}  // namespace vexa::host
