// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/alarm_feed.h"

#include <algorithm>
#include <utility>

#include "virtual_camera/values/number_text.h"

namespace vexa::camera {

AlarmFeed::AlarmFeed(asio::io_context& context, Clock::duration interval, Changes changes,
                     std::function<std::string()> present)
    : interval_(interval), changes_(changes), present_(std::move(present)), next_part_(context) {}

std::string AlarmFeed::head() const {
  return "HTTP/1.0 200 OK\r\nContent-Type: multipart/x-mixed-replace;boundary=alarm\r\n\r\n";
}

void AlarmFeed::take_alarm(const std::string& part) {
  if (changes_ == Changes::kLeftOut) return;
  parts_.push_back(part);
  next_part_.cancel();
}

void AlarmFeed::go_on(Line& line) {
  if (!parts_.empty()) {
    std::string part = std::move(parts_.front());
    parts_.pop_front();
    return send(line, std::move(part));
  }
  if (std::exchange(part_due_, false)) return send(line, present_());
  next_part_.expires_after(interval_);
  next_part_.async_wait([weak = weak_from_this(), wake = line.waker()](asio::error_code stopped) {
    const std::shared_ptr<AlarmFeed> self = weak.lock();
    if (!self) return;
    self->part_due_ = !stopped;
    wake();
  });
}

void AlarmFeed::send(Line& line, std::string part) {
  line.send_at(Clock::now(), [part = std::move(part)] { return part; });
}

std::chrono::seconds feed_interval(std::string_view query) {
  constexpr std::string_view kKey = "interval=";
  constexpr int kLongest = 3600;
  if (!query.starts_with(kKey)) return std::chrono::seconds(1);
  const int seconds = leading_number(query.substr(kKey.size())).value_or(1);
  return std::chrono::seconds(std::clamp(seconds, 1, kLongest));
}

}  // namespace vexa::camera
