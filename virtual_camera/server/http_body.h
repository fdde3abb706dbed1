// SPDX-License-Identifier: Apache-2.0
// The body of an HTTP answer that goes on after its head: pictures, sound or alarms.
#ifndef VIRTUAL_CAMERA_SERVER_HTTP_BODY_H_
#define VIRTUAL_CAMERA_SERVER_HTTP_BODY_H_

#include <chrono>
#include <functional>
#include <string>

namespace vexa::camera {

// Owned by the connection whose answer it continues; on the loop's thread.
class HttpBody {
 public:
  using Clock = std::chrono::steady_clock;

  // What a body does with its connection.
  class Line {
   public:
    Line() = default;
    virtual ~Line() = default;
    Line(const Line&) = delete;
    Line& operator=(const Line&) = delete;

    // Sends what `make` returns at that time, then calls the body's go_on().
    virtual void send_at(Clock::time_point time, std::function<std::string()> make) = 0;
    // Ends the stream and waits for the peer to go.
    virtual void finish() = 0;
    // From any thread: go_on() is called soon on the loop's, unless the body is gone by then.
    [[nodiscard]] virtual std::function<void()> waker() = 0;
  };

  HttpBody() = default;
  virtual ~HttpBody() = default;
  HttpBody(const HttpBody&) = delete;
  HttpBody& operator=(const HttpBody&) = delete;

  // The head of the answer.
  [[nodiscard]] virtual std::string head() const = 0;
  // The head, or what was sent last, has left.
  virtual void go_on(Line& line) = 0;
  // Something has changed around the camera; `part` reports it.
  virtual void take_alarm(const std::string&) {}
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_HTTP_BODY_H_
