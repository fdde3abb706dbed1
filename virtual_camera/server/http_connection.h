// SPDX-License-Identifier: Apache-2.0
// The camera's HTTP side: one request, one answer, then the connection ends. The answer may be a stream without end.
#ifndef VIRTUAL_CAMERA_SERVER_HTTP_CONNECTION_H_
#define VIRTUAL_CAMERA_SERVER_HTTP_CONNECTION_H_

#include <functional>
#include <memory>
#include <string>
#include <string_view>

#include "virtual_camera/server/connection.h"
#include "virtual_camera/server/http_body.h"

namespace vexa::camera {

// Routes a request to settings, motors, card or streams. On the loop's thread; owns the body of a running stream.
class HttpConnection : public Connection, private HttpBody::Line {
 public:
  using Connection::Connection;

  void take_alarm(const std::string& part) override;

 private:
  RequestKind kind() const override { return RequestKind::kHttp; }
  std::size_t request_size(std::string_view received) const override;
  Answer answer(const std::string& request) override;
  Answer refuse(const std::string& request, std::string_view status) const override;
  Next answered() override { return body_ ? Next::kStream : Next::kCloseConnection; }
  bool may_idle() const override { return false; }
  void stream() override { body_->go_on(*this); }
  void ended() override { body_.reset(); }

  void send_at(HttpBody::Clock::time_point time, std::function<std::string()> make) override;
  void finish() override { finish_stream(); }
  [[nodiscard]] std::function<void()> waker() override;

  std::shared_ptr<HttpBody> body_;  // null: the answer is whole
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_HTTP_CONNECTION_H_
