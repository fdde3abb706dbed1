// SPDX-License-Identifier: Apache-2.0
// The driver's own operations and its latest error.
#include <gtest/gtest.h>

#include <atomic>
#include <cerrno>
#include <thread>
#include <vector>

#include "tests/device/settings_exchange.h"

namespace vexa_test {
namespace {

TEST(LatestError, OfAFreshDriverIsEmpty) {
  TestDriver driver;
  std::string text = "before";
  EXPECT_EQ(driver.GetLatestErrorText(text), LIBD_OK);
  EXPECT_EQ(text, "");
  EXPECT_EQ(driver.LatestErrorCode(), LIBD_FAILED);
}

TEST(LatestError, KeepsItsCodeWhenAFailureHasNone) {
  TestDriver driver;
  driver.Fail(vexa::kReceiveTimedOut);
  driver.Fail(vexa::kUrlTooLong);
  EXPECT_EQ(driver.LatestErrorCode(), LIBD_TIMEOUT);
  EXPECT_EQ(text_of_latest_error(driver), "URL too long");
}

TEST(LatestError, KeepsItsTextWhenItsCodeIsCleared) {
  TestDriver driver;
  driver.Fail(vexa::kReceiveTimedOut);
  driver.ClearLatestError();
  EXPECT_EQ(driver.LatestErrorCode(), LIBD_FAILED);
  EXPECT_EQ(text_of_latest_error(driver), "Receive timed out");
}

TEST(LatestError, KeepsItsTextWhenAFailureHasNone) {
  TestDriver driver;
  driver.Fail(vexa::kReceiveTimedOut);
  driver.Fail(vexa::kNoReason);
  EXPECT_EQ(driver.latest_error(), "-200 Receive timed out");
}

TEST(SystemFailure, HasTheSystemsText) {
  errno = ENOENT;
  EXPECT_EQ(vexa::system_failure().text, "No such file or directory");
  EXPECT_EQ(vexa::system_failure(ECONNREFUSED).text, "Connection refused");
  EXPECT_EQ(vexa::system_failure(ECONNREFUSED).code, LIBD_FAILED);
}

TEST(LatestError, IsWholeWhenSeveralThreadsFailAtOnce) {
  TestDriver driver;
  driver.use(own_loopback(0), refusing_port(), kPatientTimeout);
  std::vector<std::thread> hosts;
  for (int host = 0; host < 4; ++host) {
    hosts.emplace_back([&driver] {
      for (int i = 0; i < 50; ++i) {
        EXPECT_EQ(driver.camera().send("/x"), LIBD_FAILED);
        EXPECT_EQ(text_of_latest_error(driver), "Connection refused");
        SLibDSystemInfo info;
        driver.GetCommonSystemInfo(info, "ContinuousPanTiltZoomFunc=1&ChannelId=3");
      }
    });
  }
  for (std::thread& host : hosts) host.join();
}

TEST(CameraType, IsAnyCommonBit) {
  TestDriver driver;
  EXPECT_EQ(driver.GetCameraType(static_cast<ELibCameraType>(0xffffffffU)), LIBD_FAILED);
  driver.m_CameraType = 6;
  const struct {
    std::uint32_t type;
    int result;
  } cases[] = {{0, 0}, {1, 0}, {2, 1}, {4, 1}, {5, 1}, {8, 0}, {0xffffffffU, 1}};
  for (const auto& c : cases) EXPECT_EQ(driver.GetCameraType(static_cast<ELibCameraType>(c.type)), c.result) << c.type;
}

TEST(SetCameraInfoFromId, OfASingleStreamCameraSendsNothing) {
  TestDriver driver;
  driver.use(own_loopback(0), refusing_port(), kPatientTimeout);
  for (const int count : {0, 1}) {
    driver.m_FixedCameraInfo.streamCount1 = driver.m_FixedCameraInfo.streamCount2 = count;
    EXPECT_EQ(driver.SetCameraInfoFromID(2), LIBD_OK);
  }
}

TEST(SetCameraInfoFromId, SwitchesTheStreamOff) {
  for (const bool first : {true, false}) {
    ScriptedCamera camera({command("/command/camera.cgi?ImageCodec3=off")});
    TestDriver driver;
    driver.use(camera.host(), camera.port(), kPatientTimeout);
    (first ? driver.m_FixedCameraInfo.streamCount1 : driver.m_FixedCameraInfo.streamCount2) = 2;
    EXPECT_EQ(driver.SetCameraInfoFromID(3), LIBD_OK);
    EXPECT_EQ(camera.finish(), "");
  }
}

TEST(SetCameraInfoFromId, GivesTheLatestErrorsCode) {
  ScriptedCamera camera({refusal("/command/camera.cgi?ImageCodec3=off")});
  TestDriver driver;
  driver.use(camera.host(), camera.port(), kPatientTimeout);
  driver.m_FixedCameraInfo.streamCount1 = 2;
  EXPECT_EQ(driver.SetCameraInfoFromID(3), LIBD_UNAUTHORIZED);
  EXPECT_EQ(camera.finish(), "");
}

TEST(LatestError, OfOtherThreadsDoesNotChangeAnOperationsResult) {
  constexpr int kCalls = 50;
  Script script;
  for (int i = 0; i < kCalls; ++i) script.push_back(refusal("/command/camera.cgi?BLComp=on"));
  ScriptedCamera camera(script);
  TestDriver driver;
  driver.use(camera.host(), camera.port(), kPatientTimeout);
  std::atomic<bool> done{false};
  std::thread other([&] {
    while (!done) {
      driver.ClearLatestError();
      driver.Fail({LIBD_TIMEOUT, "silent"});
    }
  });
  for (int i = 0; i < kCalls; ++i) EXPECT_EQ(driver.SetBackLightCompMode(true), LIBD_UNAUTHORIZED);
  done = true;
  other.join();
  EXPECT_EQ(camera.finish(), "");
}

TEST(LatestError, OfOneDriverIsNotAnothers) {
  TestDriver first;
  first.Fail({LIBD_TIMEOUT, "silent"});
  TestDriver second;
  EXPECT_EQ(second.LatestErrorCode(), LIBD_FAILED);
  second.Fail({LIBD_UNAUTHORIZED, "refused"});
  EXPECT_EQ(first.LatestErrorCode(), LIBD_TIMEOUT);
  EXPECT_EQ(second.LatestErrorCode(), LIBD_UNAUTHORIZED);
}

}  // namespace
}  // namespace vexa_test
