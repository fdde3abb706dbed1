// A virtual camera on an address of its own, and drivers that stream from it.
#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <optional>
#include <string>
#include <utility>

#include "tests/media/media_driver.h"
#include "tests/media/pace.h"
#include "tests/support/own_address.h"
#include "virtual_camera/codec/jpeg_picture.h"
#include "virtual_camera/codec/rtp_packetiser.h"
#include "virtual_camera/virtual_camera.h"

namespace vexa_test {

inline vexa::camera::CameraOptions camera_options(unsigned index = 0) {
  vexa::camera::CameraOptions options;
  options.address = own_loopback(index);
  options.password = "secret";
  options.clip_path = VEXA_CLIPS "/small.h264";
  options.speed = kPace;
  return options;
}

/// The options of a camera whose streams stand still while a driver that keeps `pace` is behind.
inline vexa::camera::CameraOptions held_by(const std::shared_ptr<KeptPace>& pace, vexa::camera::CameraOptions options) {
  options.hold_pictures = [pace] { return pace->is_behind(); };
  return options;
}

/// Starts in its constructor; the port of RTSP is 554, where drivers look for it. It sends no faster than the hosts of
/// the drivers that were introduced to it take their frames.
class LiveCamera {
 public:
  explicit LiveCamera(vexa::camera::CameraOptions options) : camera_(held_by(pace_, std::move(options))) {
    EXPECT_TRUE(camera_.start()) << camera_.error();
  }
  vexa::camera::VirtualCamera* operator->() { return &camera_; }

  void introduce(MediaDriver& driver, int timeout = 5000) {
    driver.use(camera_.address(), camera_.http_port(), timeout);
    driver.use_live(codec_name());
    driver.keep_pace(pace_);
  }
  /// Introduces itself, and its video begins.
  void play(MediaDriver& driver) {
    introduce(driver);
    ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  }

  bool is_key(std::uint64_t index) const { return camera_.clip()->is_key(place(index)); }

  /// Picture `index` of the stream: as it must arrive; of JPEG as the encoder made it.
  std::string picture(std::uint64_t index) const {
    const auto bytes = camera_.clip()->picture(place(index));
    return {bytes.begin(), bytes.end()};
  }

  /// Whether the frame is picture `index`. A JPEG picture arrives with a header of the driver's: it must tell the same.
  bool sent(std::uint64_t index, const std::string& frame) const {
    if (camera_.clip()->codec() != vexa::camera::Codec::kJpeg) return frame == picture(index);
    const auto arrived = read_frame(frame);
    return arrived && arrived == read_frame(picture(index));
  }

 private:
  static std::optional<vexa::camera::JpegPicture> read_frame(const std::string& jpeg) {
    return vexa::camera::read_jpeg({reinterpret_cast<const std::uint8_t*>(jpeg.data()), jpeg.size()});
  }
  std::size_t place(std::uint64_t index) const {
    return static_cast<std::size_t>(index % camera_.clip()->pictures().size());
  }

 protected:
  const char* codec_name() const {
    if (camera_.clip() == nullptr) return "H.264";
    switch (camera_.clip()->codec()) {
      case vexa::camera::Codec::kJpeg:
        return "JPEG";
      case vexa::camera::Codec::kMpeg4:
        return "MPEG4";
      case vexa::camera::Codec::kH264:
        break;
    }
    return "H.264";
  }

 private:
  const std::shared_ptr<KeptPace> pace_ = std::make_shared<KeptPace>();
  vexa::camera::VirtualCamera camera_;
};

}  // namespace vexa_test
