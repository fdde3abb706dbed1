// SPDX-License-Identifier: Apache-2.0
// The streams of alarm data and motion metadata as the body of an HTTP answer: a part at each interval and, of alarm
// data, one at each change.
#ifndef VIRTUAL_CAMERA_SERVER_ALARM_FEED_H_
#define VIRTUAL_CAMERA_SERVER_ALARM_FEED_H_

#include <asio/steady_timer.hpp>
#include <chrono>
#include <deque>
#include <functional>
#include <memory>
#include <string>
#include <string_view>

#include "virtual_camera/server/http_body.h"

namespace vexa::camera {

// Owned by the connection and held by its timer; on the loop's thread. Made by make_shared only.
class AlarmFeed : public HttpBody, public std::enable_shared_from_this<AlarmFeed> {
 public:
  enum class Changes { kLeftOut, kSentAtOnce };

  // `present` returns the part of what holds now.
  AlarmFeed(asio::io_context& context, Clock::duration interval, Changes changes, std::function<std::string()> present);

  [[nodiscard]] std::string head() const override;
  void go_on(Line& line) override;
  void take_alarm(const std::string& part) override;

 private:
  void send(Line& line, std::string part);

  const Clock::duration interval_;
  const Changes changes_;
  const std::function<std::string()> present_;
  std::deque<std::string> parts_;  // of changes, not sent yet
  bool part_due_ = true;
  asio::steady_timer next_part_;
};

// The time between parts that a query asks for, "interval=SECONDS" from 1 to 3600; a second where it names none.
[[nodiscard]] std::chrono::seconds feed_interval(std::string_view query);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_ALARM_FEED_H_
