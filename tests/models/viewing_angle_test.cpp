// SPDX-License-Identifier: Apache-2.0
// Viewing angles of the shipped models over their whole zoom, against exact arithmetic.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <string>
#include <variant>
#include <vector>

#include "device/cgi/position_text.h"
#include "vexa/models.h"
#include "virtual_camera/model/camera_profile.h"
#include "virtual_camera/ptz/ptz_mechanism.h"

namespace vexa_test {
namespace {

/// A magnification as a fraction; its parts stay below 2^32.
struct Fraction {
  std::int64_t over;
  std::int64_t under;
};

Fraction exact_magnification(const std::vector<SLibDZoomRatioInt>& curve, int position) {
  for (std::size_t i = 1; i < curve.size(); ++i) {
    if (position < curve[i - 1].position || position > curve[i].position) continue;
    const std::int64_t length = curve[i].position - curve[i - 1].position;
    const std::int64_t way = position - curve[i - 1].position;
    return {curve[i - 1].ratio * length + (curve[i].ratio - curve[i - 1].ratio) * way, length};
  }
  return {position < curve.front().position ? curve.front().ratio : curve.back().ratio, 1};
}

TEST(ViewingAngles, OfEveryModelAreExactToTheirLastDigit) {
  int models = 0;
  for (const std::string& name : vexa::ProfileNames()) {
    vexa::Profile profile;
    vexa::ProfileError error;
    ASSERT_TRUE(vexa::LoadProfile(name, profile, error)) << error.Message();
    if ((profile.cameraTypes & vexa::kPtzCamera) == 0) continue;
    ++models;
    const SLibDFixedPanTiltInfo& turn = profile.control.panTilt;
    const auto file = vexa::camera::load_camera_profile(vexa::ProfileFolder() + "/" + name + ".json");
    const vexa::camera::PtzProfile& camera = *std::get<vexa::camera::CameraProfile>(file).ptz;
    for (int position = 0; position <= profile.control.zoom.maxPosition + 100; ++position) {
      const auto told = vexa::viewing_angles(profile.zoomRatios, turn, position);
      ASSERT_TRUE(told.has_value());
      const Fraction magnification = exact_magnification(profile.zoomRatios, position);
      // The magnification is cut to 1/10000 first, and each angle to its last digit then.
      const std::int64_t cut = magnification.over * 10000 / magnification.under;
      const std::int64_t wide = turn.horizontalWideAngle;
      ASSERT_EQ(told->horizontal, wide * 100000000 / cut) << name << " " << position;
      ASSERT_EQ(told->vertical, told->horizontal * std::int64_t{turn.verticalWideAngle} / wide)
          << name << " " << position;
      const std::int64_t exact = wide * 10000 * magnification.under / magnification.over;
      const std::int64_t finest = 1 + exact / cut;  // a digit of the magnification, in digits of the angle
      ASSERT_GE(told->horizontal, exact) << name << " " << position;
      ASSERT_LE(told->horizontal, exact + finest) << name << " " << position;
      const double seen = camera.pan.wide_angle / vexa::camera::magnification_at(camera, position);
      ASSERT_NEAR(seen * 10000, static_cast<double>(exact), 1) << name << " " << position;
    }
  }
  EXPECT_EQ(models, 3);
}

}  // namespace
}  // namespace vexa_test
