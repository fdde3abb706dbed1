// SPDX-License-Identifier: Apache-2.0
// Detection settings of every kind through a camera: what a host sets it reads back, request by request.
#include <gtest/gtest.h>
#include <rapidcheck.h>
#include <rapidcheck/gtest.h>

#include <string>
#include <vector>

#include "tests/device/alarm_driver.h"
#include "tests/device/any_detection.h"
#include "tests/support/own_address.h"
#include "virtual_camera/virtual_camera.h"

namespace vexa_test {
namespace {

/// One camera and one driver for all rounds of a property.
class DetectionCamera {
 public:
  DetectionCamera() : camera_(options()) {
    EXPECT_TRUE(camera_.start()) << camera_.error();
    driver.use(camera_.address(), camera_.http_port(), kPatientTimeout);
  }

  /// The camera as it left the factory.
  void forget() {
    camera_.settings().erase_section("objectdetection");
    camera_.settings().set("objectdetection", "PositionMode", "preset");
    camera_.settings().set("objectdetection", "ODPreDef", "0");
  }

  AlarmDriver driver;

 private:
  static vexa::camera::CameraOptions options() {
    vexa::camera::CameraOptions options;
    options.address = own_loopback(5);
    options.password = "secret";
    options.rtsp_port = 0;
    return options;
  }

  vexa::camera::VirtualCamera camera_;
};

TEST(DetectionCamera, GivesBackEverySettingThatItWasSent) {
  DetectionCamera camera;
  camera.driver.m_FixedPTZControlInfo.presetCount = 16;
  const bool held = rc::check([&camera] {
    camera.forget();
    const int presets = *rc::gen::inRange(0, 4);
    std::vector<SLibDDetectionParam> sent;
    for (int number = 1; number <= presets; ++number) sent.push_back(any_setting(number));
    sent.push_back(any_setting(99));
    for (SLibDDetectionParam& param : sent) RC_ASSERT(camera.driver.SetDetectionParam(param) == LIBD_OK);
    std::vector<SLibDDetectionParam> read;
    auto mode = LIBD_POSITION_CURRENT;
    RC_ASSERT(camera.driver.GetObjectDetectionSetting(read, mode) == LIBD_OK);
    RC_ASSERT(mode == LIBD_POSITION_PRESET);
    RC_ASSERT(read.size() == sent.size());
    for (std::size_t i = 0; i < read.size(); ++i) {
      RC_ASSERT(setting_rows(read[i]) == setting_rows(as_told(sent[i])));
    }
  });
  EXPECT_TRUE(held);
}

}  // namespace
}  // namespace vexa_test
