// SPDX-License-Identifier: Apache-2.0
// "/imageN" and "/audio": a stream of pictures or sound as the body of an HTTP answer.
#ifndef VIRTUAL_CAMERA_SERVER_MEDIA_STREAM_H_
#define VIRTUAL_CAMERA_SERVER_MEDIA_STREAM_H_

#include <chrono>
#include <functional>
#include <memory>
#include <string>

#include "virtual_camera/server/http_body.h"
#include "virtual_camera/source/http_stream.h"

namespace vexa::camera {

struct CameraState;

// Sends the pieces of an HttpStream when they are due. Owned by the connection whose answer it continues; on the loop's
// thread.
class MediaStream : public HttpBody {
 public:
  MediaStream(HttpStream stream, std::function<bool()> holds_pictures);

  [[nodiscard]] std::string head() const override { return stream_.head(); }
  void go_on(Line& line) override;

 private:
  [[nodiscard]] bool holds(std::chrono::nanoseconds due);

  HttpStream stream_;
  std::function<bool()> holds_pictures_;  // CameraOptions::hold_pictures
  bool begun_ = false;
  Clock::time_point began_;
};

// The pictures of stream `number`; null where the camera has none.
[[nodiscard]] std::unique_ptr<HttpBody> open_image_stream(const std::shared_ptr<CameraState>& state, int number);
// The sound in the codec that is set; null where the camera has none.
[[nodiscard]] std::unique_ptr<HttpBody> open_sound_stream(const std::shared_ptr<CameraState>& state);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_MEDIA_STREAM_H_
