// SPDX-License-Identifier: Apache-2.0
// How often a call allocates once the driver has made the same call before.
#include <gtest/gtest.h>

#include <string>

#include "tests/device/settings_exchange.h"
#include "tests/support/failing_new.h"

namespace vexa_test {
namespace {

constexpr char kCameraAnswer[] =
    "VideoStd=ntsc&VidCapSize=1280,960&SolidPTZ=on&ImageMaxSize=1280,960&ImageCodec1=h264&ImageSize1=1280,720&"
    "FrameRate1=25&BitRate1=2000&RTSPPort=554&DayNightMode=auto&XDNR=mid&ViewDR=off";
constexpr char kSystemAnswer[] =
    "ModelName=VX-PT120&SoftVersion=1.02.03-long-enough&Serial=1234567890123456&ChannelId=1&"
    "ContinuousPanTiltZoomFunc=1";
constexpr char kNetworkAnswer[] = "MacAddress=00:11:22:33:44:55";

/// Allocations of the second of two like calls.
template <typename Call>
int allocations_of_a_repeated(Script exchange, Call call) {
  Script twice = exchange;
  twice.insert(twice.end(), exchange.begin(), exchange.end());
  Played<CVexaCommon> play(twice);
  EXPECT_EQ(call(play.driver), LIBD_OK);
  const AllocationCount allocations;
  EXPECT_EQ(call(play.driver), LIBD_OK);
  return allocations.so_far();
}

TEST(AllocationCount, OfGetCameraInfo) {
  SLibDCameraInfo info;
  EXPECT_LE(allocations_of_a_repeated({inquiry("camera", kCameraAnswer)},
                                      [&](SettingsDriver& driver) { return driver.GetCameraInfo(info); }),
            8);
}

TEST(AllocationCount, OfGetCurrentSystemInfo) {
  SLibDSystemInfo info;
  EXPECT_LE(allocations_of_a_repeated({inquiry("system", kSystemAnswer), inquiry("network", kNetworkAnswer)},
                                      [&](SettingsDriver& driver) { return driver.GetCurrentSystemInfo(info); }),
            11);
}

TEST(AllocationCount, OfACommand) {
  EXPECT_LE(allocations_of_a_repeated({command("/command/camera.cgi?XDNR=high")},
                                      [](SettingsDriver& driver) { return driver.SetXdnrMode(LIBD_XDNR_HIGH); }),
            6);
}

}  // namespace
}  // namespace vexa_test
