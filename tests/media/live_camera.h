// A virtual camera on an address of its own, and drivers that stream from it.
#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "tests/media/media_driver.h"
#include "tests/support/own_address.h"
#include "virtual_camera/rtp_packetiser.h"
#include "virtual_camera/virtual_camera.h"

namespace vexa_test {

/// How many times faster than in life cameras play. A thread that watches every access gives hosts no time to spare, and
/// a queue of 30 frames is soon full.
#if defined(__SANITIZE_THREAD__)
constexpr double kPace = 1;
#else
constexpr double kPace = 4;
#endif

inline vexa::camera::CameraOptions camera_options(unsigned index = 0) {
  vexa::camera::CameraOptions options;
  options.address = own_loopback(index);
  options.password = "secret";
  options.clip_path = VEXA_CLIPS "/small.h264";
  options.speed = kPace;
  return options;
}

/// Starts in its constructor; the port of RTSP is 554, where drivers look for it.
class LiveCamera {
 public:
  explicit LiveCamera(const vexa::camera::CameraOptions& options) : camera_(options) {
    EXPECT_TRUE(camera_.start()) << camera_.error();
  }
  vexa::camera::VirtualCamera* operator->() { return &camera_; }

  void introduce(MediaDriver& driver, int timeout = 5000) {
    driver.use(camera_.address(), camera_.http_port(), timeout);
    driver.use_live_h264();
  }

  bool is_key(std::uint64_t index) const {
    const auto& units = camera_.clip()->clip().access_units();
    return units[static_cast<std::size_t>(index % units.size())].key;
  }

  /// Picture `index` of the stream, as it must arrive.
  std::string picture(std::uint64_t index) const {
    const auto& units = camera_.clip()->clip().access_units();
    const auto bytes = units[static_cast<std::size_t>(index % units.size())].as_delivered();
    return {bytes.begin(), bytes.end()};
  }

 private:
  vexa::camera::VirtualCamera camera_;
};

}  // namespace vexa_test
