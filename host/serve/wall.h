// SPDX-License-Identifier: Apache-2.0
// The cameras that a server shows: what each is doing, and its latest picture.
#ifndef HOST_SERVE_WALL_H_
#define HOST_SERVE_WALL_H_

#include <cstddef>
#include <cstdint>
#include <deque>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "host/serve/video_feed.h"
#include "vexa/session.h"

namespace vexa::host {

using Jpeg = SharedBytes;

// Whether a picture is too old to be shown as live: older than two intervals between pictures, and than 2 s.
[[nodiscard]] bool is_stale(std::int64_t age, std::int64_t interval);

// One camera. Times are milliseconds of CLOCK_MONOTONIC. On the thread of the event loop.
class WallCamera {
 public:
  explicit WallCamera(std::string name) : name_(std::move(name)) {}

  void take_status(const SessionStatus& status);
  // A picture in JPEG is kept until the next; of any other codec it is counted only.
  void take_frame(const SessionFrame& frame, bool is_jpeg, std::int64_t wall_clock);

  // Its H.264, for those who watch it large.
  [[nodiscard]] VideoFeed& video() { return video_; }
  [[nodiscard]] const VideoFeed& video() const { return video_; }

  [[nodiscard]] const std::string& name() const { return name_; }
  [[nodiscard]] SessionState state() const { return state_; }
  [[nodiscard]] const std::string& why() const { return why_; }
  [[nodiscard]] const Jpeg& picture() const { return picture_; }  // null: none has come
  [[nodiscard]] std::uint64_t picture_number() const { return picture_number_; }
  [[nodiscard]] std::uint64_t pictures() const { return pictures_; }
  [[nodiscard]] std::uint64_t bytes() const { return bytes_; }
  [[nodiscard]] std::uint64_t interruptions() const { return interruptions_; }
  [[nodiscard]] std::uint32_t attempt() const { return attempt_; }
  [[nodiscard]] std::int64_t last_picture_time() const { return last_wall_clock_; }  // since 1970 UTC; 0: none
  // Pictures a second over the latest five seconds.
  [[nodiscard]] double rate(std::int64_t now) const;
  // Of the latest picture; nullopt before the first.
  [[nodiscard]] std::optional<std::int64_t> age(std::int64_t now) const;
  [[nodiscard]] bool stale(std::int64_t now) const;

 private:
  const std::string name_;
  SessionState state_ = SessionState::kIdle;
  std::uint32_t attempt_ = 0;
  std::string why_;
  Jpeg picture_;
  std::uint64_t picture_number_ = 0;
  std::uint64_t pictures_ = 0;
  std::uint64_t bytes_ = 0;
  std::uint64_t interruptions_ = 0;
  std::int64_t last_wall_clock_ = 0;
  std::int64_t latest_ = 0;
  std::int64_t interval_ = 0;  // between the latest two
  VideoFeed video_;
  std::deque<std::int64_t> recent_;  // arrivals of the latest five seconds, at most 1000
};

// What the server counts of itself.
struct ServeCounts {
  std::uint64_t viewers = 0;  // now
  std::uint64_t connections = 0;
  std::uint64_t refused = 0;
  std::uint64_t pictures_sent = 0;
  std::uint64_t fragments_sent = 0;
  std::uint64_t fragments_missed = 0;  // by viewers that were too slow
};

class Wall {
 public:
  // Pointers stay valid as long as the wall.
  WallCamera& add(std::string name);
  [[nodiscard]] std::size_t size() const { return cameras_.size(); }
  [[nodiscard]] const WallCamera& camera(std::size_t index) const { return *cameras_[index]; }
  [[nodiscard]] WallCamera& camera(std::size_t index) { return *cameras_[index]; }
  // nullopt: there is none of that name.
  [[nodiscard]] std::optional<std::size_t> find(std::string_view name) const;
  // Whether each camera has been tried.
  [[nodiscard]] bool ready() const;

  // Every camera's state, as the page and programs get it.
  [[nodiscard]] std::string states(std::int64_t now) const;
  [[nodiscard]] static std::string state_of(const WallCamera& camera, std::int64_t now);

  enum class MetricsFormat { kPrometheus, kOpenMetrics };
  [[nodiscard]] std::string metrics(MetricsFormat format, const ServeCounts& counts, std::string_view version) const;

 private:
  std::vector<std::unique_ptr<WallCamera>> cameras_;
};

// The format that an Accept field prefers.
[[nodiscard]] Wall::MetricsFormat metrics_format(std::string_view accept);
// The Content-Type of the answer.
[[nodiscard]] std::string_view metrics_type(Wall::MetricsFormat format);

}  // namespace vexa::host

#endif  // HOST_SERVE_WALL_H_
