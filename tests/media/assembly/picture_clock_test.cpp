// SPDX-License-Identifier: Apache-2.0
#include "media/assembly/picture_clock.h"

#include <gtest/gtest.h>

namespace vexa::test {
namespace {

struct ClockCase {
  const char* what;
  PictureTime base;
  std::uint32_t elapsed;
  int rate;
  PictureTime time;
};

TEST(PictureClock, CountsTicksFromTheBase) {
  const ClockCase cases[] = {
      {"the base itself", {1000, 250000}, 0, 90000, {1000, 250000}},
      {"one picture at 25 a second", {1000, 0}, 3600, 90000, {1000, 40000}},
      {"one second", {1000, 999999}, 90000, 90000, {1001, 999999}},
      {"a carry", {1000, 999999}, 1, 90000, {1001, 10}},
      {"exactly a million", {1000, 960000}, 3600, 90000, {1001, 0}},
      {"the longest difference", {0, 0}, 4294967295u, 90000, {47721, 858833}},
      {"a large fraction from the camera", {10, 2500000}, 0, 90000, {12, 500000}},
      {"a clock of one tick", {0, 0}, 7, 1, {7, 0}},
      {"a clock without a rate", {1000, 250000}, 3600, 0, {0, 0}},
      {"a clock that runs backwards", {1000, 250000}, 3600, -1, {0, 0}},
  };
  for (const ClockCase& c : cases) {
    const PictureTime time = picture_time(c.base, c.elapsed, c.rate);
    EXPECT_EQ(time.seconds, c.time.seconds) << c.what;
    EXPECT_EQ(time.microseconds, c.time.microseconds) << c.what;
  }
}

}  // namespace
}  // namespace vexa::test
