// The camera's HTTP side: one request, one answer, then the connection ends. The answer may be a stream without end.
#ifndef VIRTUAL_CAMERA_HTTP_CONNECTION_H_
#define VIRTUAL_CAMERA_HTTP_CONNECTION_H_

#include <chrono>
#include <optional>
#include <string>
#include <string_view>

#include "virtual_camera/connection.h"
#include "virtual_camera/http_stream.h"

namespace vexa::camera {

class HttpConnection : public Connection {
 public:
  using Connection::Connection;

 private:
  RequestKind kind() const override { return RequestKind::kHttp; }
  std::size_t request_size(std::string_view received) const override;
  Answer answer(const std::string& request) override;
  Answer refuse(const std::string& request, std::string_view status) const override;
  Next answered() override;
  bool may_idle() const override { return false; }
  void stream() override;

  std::optional<HttpStream> open_stream(const std::string& path) const;

  std::optional<HttpStream> stream_;
  std::chrono::steady_clock::time_point stream_began_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_HTTP_CONNECTION_H_
