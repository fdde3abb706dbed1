// The camera's HTTP side: one request, one answer, then the connection ends. The answer may be a stream without end.
#ifndef VIRTUAL_CAMERA_SERVER_HTTP_CONNECTION_H_
#define VIRTUAL_CAMERA_SERVER_HTTP_CONNECTION_H_

#include <chrono>
#include <deque>
#include <optional>
#include <string>
#include <string_view>

#include "virtual_camera/server/connection.h"
#include "virtual_camera/source/http_stream.h"

namespace vexa::camera {

class HttpConnection : public Connection {
 public:
  HttpConnection(asio::ip::tcp::socket socket, std::shared_ptr<CameraState> state);

  void take_alarm(const std::string& part) override;

 private:
  RequestKind kind() const override { return RequestKind::kHttp; }
  std::size_t request_size(std::string_view received) const override;
  Answer answer(const std::string& request) override;
  Answer refuse(const std::string& request, std::string_view status) const override;
  Next answered() override;
  bool may_idle() const override { return false; }
  void stream() override;
  void ended() override;

  std::optional<HttpStream> open_stream(const std::string& path) const;
  std::optional<HttpStream> open_images(int number) const;
  std::optional<HttpStream> open_sound() const;
  HttpStreamOptions stream_options() const;
  void wait_for_picture();

  // The streams of alarm data and motion metadata: a part at each interval and, of alarm data, at each change.
  enum class Feed { kNone, kAlarms, kMetadata };

  std::optional<Answer> open_feed(const RequestHead& head);
  Answer command(const RequestHead& head);
  std::optional<bool> move(const RequestHead& head);
  void stream_feed();
  void send_part(std::string part);

  Feed feed_ = Feed::kNone;
  std::chrono::steady_clock::duration interval_{0};
  std::deque<std::string> parts_;  // of changes, not sent yet
  bool part_due_ = true;
  asio::steady_timer next_part_;
  std::optional<HttpStream> stream_;
  std::chrono::steady_clock::time_point stream_began_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_HTTP_CONNECTION_H_
