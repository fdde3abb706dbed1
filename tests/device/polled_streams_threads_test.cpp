// SPDX-License-Identifier: Apache-2.0
// Alarm and metadata streams, polled, started and stopped from several host threads at once.
#include <gtest/gtest.h>

#include <atomic>
#include <string>
#include <thread>
#include <vector>

#include "tests/device/alarm_driver.h"
#include "tests/support/process_state.h"

namespace vexa_test {
namespace {

constexpr int kStarts = 6;

class PolledStreams : public testing::Test {
 protected:
  PolledStreams() {
    camera_.introduce(driver_, 1000);
    camera_.set_inquiry("sensor", "Sensor1=1");
    driver_.m_FixedIoBoxInfo.tamperingDetection = true;
  }

  AlarmCamera camera_;
  AlarmDriver driver_;
};

bool is_status_code(ELibDReturnCode code) {
  return code == LIBD_OK || code == LIBD_FAILED || code == LIBD_TIMEOUT || code == LIBD_NO_FRAME;
}

TEST_F(PolledStreams, AreStartedStoppedAndPolledAtOnce) {
  std::atomic<bool> over{false};
  std::vector<std::thread> hosts;
  for (int poller = 0; poller < 2; ++poller) {
    hosts.emplace_back([&] {
      while (!over) {
        std::vector<SLibDPinInfo> pins;
        EXPECT_TRUE(is_status_code(driver_.GetCurrentIoStatus(pins)));
        SLibDRawMDFrameInfo frame;
        EXPECT_TRUE(is_status_code(driver_.GetCurrentPosition(frame)));
      }
    });
  }
  hosts.emplace_back([&] {
    while (!over) {
      SLibDIoBoxInfo info;
      EXPECT_TRUE(is_status_code(driver_.GetIoBoxInfo(info)));
      EXPECT_EQ(driver_.SetVMDtype(LIBD_VMD_VMF), LIBD_OK);
      EXPECT_TRUE(is_status_code(driver_.SetTamperingAlarm(true, LIBD_TAMPER_LOW)));
      alarm_clock_now += 1;
    }
  });
  hosts.emplace_back([&] {
    while (!over) {
      camera_.chatter("Sensor1=1&Tampering=1&Window1=1\r\n\r\n" + std::string(64, ' '));
      std::this_thread::yield();
    }
  });
  std::vector<std::thread> starters;
  for (int starter = 0; starter < 2; ++starter) {
    starters.emplace_back([&] {
      for (int i = 0; i < kStarts; ++i) {
        driver_.StartIoStreaming();
        driver_.StartModRawData();
        driver_.StopModRawData();
        driver_.StopIoStreaming();
      }
    });
  }
  for (std::thread& starter : starters) starter.join();
  over = true;
  for (std::thread& host : hosts) host.join();
  driver_.StopIoStreaming();
  driver_.StopModRawData();
  const std::size_t opened = camera_.opened_streams();
  EXPECT_GE(opened, 2U);
  EXPECT_EQ(camera_.closed_streams(opened), opened);  // none was lost open
}

TEST_F(PolledStreams, AreStoppedAlthoughOnePollFollowsTheOther) {
  camera_.introduce(driver_, kPatientTimeout);
  camera_.set_inquiry("sensor", "");
  ASSERT_EQ(driver_.StartIoStreaming(), LIBD_OK);
  ASSERT_EQ(driver_.StartModRawData(), LIBD_OK);
  camera_.introduce(driver_, 200);
  constexpr int kMostPolls = 30;
  for (const bool alarms : {true, false}) {
    std::atomic<int> polls{0};
    std::thread poller([&] {
      std::vector<SLibDPinInfo> pins;
      SLibDRawMDFrameInfo frame;
      const auto poll = [&] { return alarms ? driver_.GetCurrentIoStatus(pins) : driver_.GetCurrentPosition(frame); };
      while (polls < kMostPolls && poll() != LIBD_FAILED) ++polls;
    });
    ASSERT_TRUE(eventually([&] { return polls > 0; }));
    alarms ? driver_.StopIoStreaming() : driver_.StopModRawData();
    poller.join();
    EXPECT_LT(polls, kMostPolls);
  }
}

}  // namespace
}  // namespace vexa_test
