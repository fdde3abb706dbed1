// The polled stream of pin states, from start to stop.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/device/alarm_driver.h"
#include "tests/support/process_state.h"

namespace vexa_test {
namespace {

using RequestPaths = std::vector<std::string>;

constexpr char kAlarmsOn[] = "/command/system.cgi?AlarmData=on";
constexpr char kAlarmsOff[] = "/command/system.cgi?AlarmData=off";
constexpr char kSensorInquiry[] = "/command/inquiry.cgi?inq=sensor";
constexpr char kClearTampering[] = "/command/system.cgi?TamperingStatusClear=on";
constexpr char kAlarmRefusal[] = "HTTP/1.0 401 Unauthorized\r\n\r\n";

class IoStream : public testing::Test {
 protected:
  IoStream() {
    camera_.introduce(driver_, 5000);
    camera_.set_inquiry("sensor", "Sensor1=1&Sensor2=0");
    driver_.m_FixedIoBoxInfo.inputCount = 2;
    driver_.m_FixedIoBoxInfo.videoDetection = driver_.m_FixedIoBoxInfo.tamperingDetection = true;
  }

  /// Starts and takes the states that wait.
  void stream() {
    ASSERT_EQ(driver_.StartIoStreaming(), LIBD_OK);
    ASSERT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_OK);
    camera_.requests();
  }
  void set_timeout(int timeout) {
    const vexa::Guard guard(driver_.m_ConnectionLock);
    driver_.m_ConnectionInfo.timeout = driver_.m_SavedTimeout = timeout;
  }
  /// One part of two quiet inputs, no motion, and tampering in this state; then a status call.
  ELibDReturnCode report_tampering(int state) {
    camera_.say(alarm_part("Sensor1=0&Sensor2=0&OdWin1=0&Tampering=" + std::to_string(state)));
    return driver_.GetCurrentIoStatus(pins_);
  }

  AlarmCamera camera_;
  AlarmDriver driver_;
  std::vector<SLibDPinInfo> pins_;
};

TEST_F(IoStream, IsOpenedBetweenSwitchingOnAndTheSensorInquiry) {
  EXPECT_EQ(driver_.StartIoStreaming(), LIBD_OK);
  EXPECT_EQ(camera_.requests(), (RequestPaths{kAlarmsOn, AlarmCamera::kAlarms, kSensorInquiry}));
  EXPECT_EQ(driver_.timeout(), 5000);
  EXPECT_EQ(driver_.StopIoStreaming(), LIBD_OK);
  EXPECT_EQ(camera_.requests(), RequestPaths{kAlarmsOff});
  EXPECT_EQ(camera_.closed_streams(1), 1U);
}

TEST_F(IoStream, WaitsTenSecondsForTheRequestsThatTakeLong) {
  RequestPaths timeouts;
  camera_.observe([&](const std::string& path) { timeouts.push_back(path + " " + std::to_string(driver_.timeout())); });
  stream();
  report_tampering(1);
  alarm_clock_now += 60;
  report_tampering(1);
  EXPECT_EQ(driver_.StopIoStreaming(), LIBD_OK);
  EXPECT_EQ(timeouts, (RequestPaths{std::string(kAlarmsOn) + " 10000", std::string(AlarmCamera::kAlarms) + " 10000",
                                    std::string(kSensorInquiry) + " 5000", std::string(kClearTampering) + " 10000",
                                    std::string(kAlarmsOff) + " 5000"}));
}

TEST_F(IoStream, HandsOutTheInputsStatesOnceBeforeItReads) {
  ASSERT_EQ(driver_.StartIoStreaming(), LIBD_OK);
  camera_.say(alarm_part("Sensor1=0&Sensor2=1"));
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_OK);
  EXPECT_EQ(rows_of(pins_), (std::vector<PinRow>{{1, 0, 1, 1}, {2, 0, 1, 0}}));
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_OK);
  EXPECT_EQ(rows_of(pins_), (std::vector<PinRow>{{1, 0, 1, 0}, {2, 0, 1, 1}}));
}

TEST_F(IoStream, ReadsAtOnceFromACameraWithoutInputs) {
  camera_.set_inquiry("sensor", "");
  ASSERT_EQ(driver_.StartIoStreaming(), LIBD_OK);
  camera_.say(alarm_part("Sensor1=1"));
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_OK);
  EXPECT_EQ(rows_of(pins_), (std::vector<PinRow>{{1, 0, 1, 1}}));
}

TEST_F(IoStream, ReadsAtMost512BytesOfTheSensorInquiry) {
  std::string long_answer = "Sensor1=1" + std::string(502, '&') + "Sensor2=1";  // the 2nd begins at byte 511
  camera_.set_inquiry("sensor", long_answer + std::string(100000, '&') + "Sensor3=1");
  ASSERT_EQ(driver_.StartIoStreaming(), LIBD_OK);
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_OK);
  EXPECT_EQ(rows_of(pins_), (std::vector<PinRow>{{1, 0, 1, 1}}));
}

TEST_F(IoStream, IsStoppedBeforeItIsStartedAgain) {
  ASSERT_EQ(driver_.StartIoStreaming(), LIBD_OK);
  camera_.requests();
  EXPECT_EQ(driver_.StartIoStreaming(), LIBD_OK);
  EXPECT_EQ(camera_.requests(), (RequestPaths{kAlarmsOff, kAlarmsOn, AlarmCamera::kAlarms, kSensorInquiry}));
  EXPECT_EQ(camera_.closed_streams(1), 1U);
  EXPECT_EQ(driver_.m_PendingPins.size(), 2U);
}

TEST_F(IoStream, ThatTheCameraDoesNotSwitchOnIsNotOpened) {
  camera_.set_answer(kAlarmsOn, kAlarmRefusal);
  EXPECT_EQ(driver_.StartIoStreaming(), LIBD_UNAUTHORIZED);
  EXPECT_EQ(camera_.requests(), RequestPaths{kAlarmsOn});
  EXPECT_EQ(driver_.timeout(), 5000);
  EXPECT_EQ(driver_.m_IoStreamSocket, -1);
}

TEST_F(IoStream, ThatIsRefusedLeavesATimeOutOf3Seconds) {
  camera_.set_answer(AlarmCamera::kAlarms, kAlarmRefusal);
  EXPECT_EQ(driver_.StartIoStreaming(), LIBD_UNAUTHORIZED);
  EXPECT_EQ(camera_.requests(), (RequestPaths{kAlarmsOn, AlarmCamera::kAlarms}));
  EXPECT_EQ(driver_.timeout(), 3000);
  EXPECT_EQ(driver_.m_SavedTimeout, 5000);
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_FAILED);
}

TEST_F(IoStream, IsStoppedWhenTheSensorInquiryFailsAndTellsWhatTheStopLeft) {
  camera_.set_answer(kSensorInquiry, kAlarmRefusal);
  EXPECT_EQ(driver_.StartIoStreaming(), LIBD_FAILED);
  EXPECT_EQ(camera_.requests(), (RequestPaths{kAlarmsOn, AlarmCamera::kAlarms, kSensorInquiry, kAlarmsOff}));
  EXPECT_EQ(camera_.closed_streams(1), 1U);
  camera_.set_answer(kAlarmsOff, kAlarmRefusal);
  EXPECT_EQ(driver_.StartIoStreaming(), LIBD_UNAUTHORIZED);
  EXPECT_EQ(driver_.timeout(), 5000);
}

TEST_F(IoStream, HasNoStatusBeforeItIsStartedOrAfterItIsStopped) {
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_FAILED);
  ASSERT_EQ(driver_.StartIoStreaming(), LIBD_OK);
  ASSERT_EQ(driver_.StopIoStreaming(), LIBD_OK);
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_FAILED);
  EXPECT_TRUE(pins_.empty());
}

TEST_F(IoStream, GivesThePinsOfEachPart) {
  stream();
  const struct {
    const char* items;
    std::vector<PinRow> pins;
  } rows[] = {{"Sensor1=1&Sensor2=0&OdWin1=1&Tampering=0", {{1, 0, 1, 1}, {2, 0, 1, 0}, {3, 2, 1, 1}, {4, 4, 1, 0}}},
              {"Sensor2=1", {{2, 0, 1, 1}}},
              {"Sensor1=0&Sensor2=0&Tampering=0", {{1, 0, 1, 0}, {2, 0, 1, 0}, {4, 2, 1, 0}}}};
  for (const auto& row : rows) {
    camera_.say(alarm_part(row.items));
    EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_OK) << row.items;
    EXPECT_EQ(rows_of(pins_), row.pins) << row.items;
  }
}

TEST_F(IoStream, GivesNoFrameForAPartWithoutPins) {
  stream();
  alarm_clock_now = 1500;
  camera_.say(alarm_part("Hello=1"));
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_NO_FRAME);
  EXPECT_TRUE(pins_.empty());
  EXPECT_EQ(driver_.m_LastIoDataTime, 1500);
}

TEST_F(IoStream, ThatFallsSilentTimesOutAfterTheGrace) {
  stream();
  set_timeout(10);
  for (const int quiet : {0, 1, 15}) {
    alarm_clock_now = 1000 + quiet;
    EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_NO_FRAME) << quiet;
  }
  alarm_clock_now = 1016;
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_TIMEOUT);
  camera_.say(alarm_part("Sensor1=1"));
  set_timeout(5000);
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_OK);
  set_timeout(10);
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_NO_FRAME);
}

TEST_F(IoStream, ThatTheCameraClosesIsQuietUntilTheSilenceIsTooLong) {
  stream();
  set_timeout(20);
  camera_.hang_up();
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_NO_FRAME);
  alarm_clock_now = 1016;
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_TIMEOUT);
}

TEST_F(IoStream, KeepsAPartThatHasNotCompletelyArrived) {
  stream();
  set_timeout(20);
  camera_.say("--part\r\nSensor1=1&Sens");
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_NO_FRAME);
  camera_.say("or2=1\r\n\r\n");
  set_timeout(5000);
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_OK);
  EXPECT_EQ(rows_of(pins_), (std::vector<PinRow>{{1, 0, 1, 1}, {2, 0, 1, 1}}));
}

TEST_F(IoStream, OfAnEndlessPartIsSilent) {
  stream();
  set_timeout(20);
  camera_.say(std::string(5000, 'x') + "\r\n\r\n");
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_NO_FRAME);
  alarm_clock_now = 1016;
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_TIMEOUT);
}

TEST_F(IoStream, TakesNumbersOutOfRangeForNoPin) {
  stream();
  for (const char* items : {"Sensor99=1", "Sensor0=1", "Sensor-1=1", "Sensor33=1", "Sensor2147483648=1",
                            "Sensor-2147483649=1", "Sensor40=1&OdWin2147483648=9&Tampering=1&Audio=1"}) {
    camera_.say(alarm_part(items));
    EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_NO_FRAME) << items;
  }
}

TEST_F(IoStream, GivesDoubledItemsOnce) {
  stream();
  camera_.say(alarm_part("Sensor1=1&Sensor1=1&Sensor2=0&Sensor2=0"));
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_OK);
  EXPECT_EQ(rows_of(pins_), (std::vector<PinRow>{{1, 0, 1, 1}, {2, 0, 1, 0}}));
}

TEST_F(IoStream, WindowsBeyondEveryNumberAreWindowsAllTheSame) {
  stream();
  camera_.say(alarm_part("Sensor1=0&Sensor2=0&OdWin2147483648=9&OdWin-7=1"));
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_OK);
  EXPECT_EQ(rows_of(pins_), (std::vector<PinRow>{{1, 0, 1, 0}, {2, 0, 1, 0}, {3, 2, 1, 1}}));
}

TEST_F(IoStream, FollowsTheVmdType) {
  stream();
  ASSERT_EQ(driver_.SetVMDtype(LIBD_VMD_VMF), LIBD_OK);
  camera_.say(alarm_part("Sensor1=0&Sensor2=0&VMF=1") + alarm_part("Sensor1=0&Sensor2=0&OdWin1=1"));
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_OK);
  EXPECT_EQ(rows_of(pins_), (std::vector<PinRow>{{1, 0, 1, 0}, {2, 0, 1, 0}, {3, 2, 1, 1}}));
  EXPECT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_OK);
  EXPECT_EQ(rows_of(pins_), (std::vector<PinRow>{{1, 0, 1, 0}, {2, 0, 1, 0}}));
}

TEST_F(IoStream, LeavesNothingOpen) {
  const std::size_t before = open_descriptors();
  for (int i = 0; i < 3; ++i) ASSERT_EQ(driver_.StartIoStreaming(), LIBD_OK);
  ASSERT_EQ(driver_.StopIoStreaming(), LIBD_OK);
  // The camera keeps its own end of each of the three.
  EXPECT_TRUE(eventually([&] { return open_descriptors() == before + 3; })) << open_descriptors() << ' ' << before;
}

TEST_F(IoStream, ClearsTamperingOnceWhenItHasBeenActiveForMoreThan59Seconds) {
  stream();
  for (const int after : {0, 30, 59}) {
    alarm_clock_now = 1000 + after;
    EXPECT_EQ(report_tampering(1), LIBD_OK);
    EXPECT_EQ(camera_.requests(), RequestPaths{}) << after;
  }
  alarm_clock_now = 1060;
  EXPECT_EQ(report_tampering(1), LIBD_OK);
  EXPECT_EQ(rows_of(pins_).back(), (PinRow{4, 4, 1, 1}));
  EXPECT_EQ(camera_.requests(), RequestPaths{kClearTampering});
  EXPECT_EQ(driver_.m_TamperingActiveSince, 0);
  EXPECT_EQ(driver_.timeout(), 5000);
  EXPECT_EQ(report_tampering(1), LIBD_OK);
  EXPECT_EQ(driver_.m_TamperingActiveSince, 1060);
  EXPECT_EQ(camera_.requests(), RequestPaths{});
}

TEST_F(IoStream, CountsTamperingAnewAfterItWasInactive) {
  stream();
  EXPECT_EQ(report_tampering(1), LIBD_OK);
  alarm_clock_now = 1040;
  EXPECT_EQ(report_tampering(0), LIBD_OK);
  EXPECT_EQ(driver_.m_TamperingActiveSince, 0);
  EXPECT_EQ(report_tampering(1), LIBD_OK);
  alarm_clock_now = 1099;
  EXPECT_EQ(report_tampering(1), LIBD_OK);
  EXPECT_EQ(camera_.requests(), RequestPaths{});
}

TEST_F(IoStream, TriesToClearTamperingAgainWhenTheCameraRefuses) {
  stream();
  camera_.set_answer(kClearTampering, kAlarmRefusal);
  EXPECT_EQ(report_tampering(1), LIBD_OK);
  alarm_clock_now = 1060;
  EXPECT_EQ(report_tampering(1), LIBD_UNAUTHORIZED);
  EXPECT_EQ(driver_.m_TamperingActiveSince, 1000);
  EXPECT_EQ(driver_.timeout(), 5000);
  camera_.set_answer(kClearTampering, "HTTP/1.0 200 OK\r\n\r\n");
  EXPECT_EQ(report_tampering(1), LIBD_OK);
  EXPECT_EQ(camera_.requests(), (RequestPaths{kClearTampering, kClearTampering}));
}

TEST_F(IoStream, DoesNotWatchTamperingInTheDetailedStatus) {
  stream();
  camera_.say(alarm_part("Sensor1=0&Sensor2=0&OdWin1=0&Tampering=1"));
  EXPECT_EQ(driver_.GetCurrentIoStatusDetail(pins_), LIBD_OK);
  EXPECT_EQ(driver_.m_TamperingActiveSince, 0);
}

TEST_F(IoStream, LosesNoChangeInAnHourAndClearsTamperingOnceAMinute) {
  stream();
  constexpr int kChanges = 10000;
  constexpr int kHour = 3600;
  int clears = 0;
  std::time_t last_clear = 0;
  for (int change = 0; change < kChanges; ++change) {
    alarm_clock_now = 1000 + change * kHour / kChanges;
    const int first = change & 1;
    const int second = change >> 1 & 1;
    const int motion = change >> 2 & 1;
    camera_.say(alarm_part("Sensor1=" + std::to_string(first) + "&Sensor2=" + std::to_string(second) +
                           "&OdWin1=" + std::to_string(motion) + "&Tampering=1"));
    ASSERT_EQ(driver_.GetCurrentIoStatus(pins_), LIBD_OK) << change;
    ASSERT_EQ(rows_of(pins_),
              (std::vector<PinRow>{{1, 0, 1, first}, {2, 0, 1, second}, {3, 2, 1, motion}, {4, 4, 1, 1}}))
        << change;
    for (const std::string& request : camera_.requests()) {
      ASSERT_EQ(request, kClearTampering);
      EXPECT_GE(alarm_clock_now - (last_clear == 0 ? 1000 : last_clear), 60);
      last_clear = alarm_clock_now;
      ++clears;
    }
  }
  EXPECT_EQ(clears, 59);
}

/// A stream that another thread opens between the stop and the opening of a start.
class OvertakenIoStart : public AlarmDriver {
 public:
  ELibDReturnCode StopIoStreaming() override {
    const ELibDReturnCode result = AlarmDriver::StopIoStreaming();
    if (m_IoStreamSocket == -1) m_IoStreamSocket = dup(other.driver_end());
    return result;
  }

  StreamPair other;
};

TEST(IoStreamStart, LosesNoStreamThatAnotherThreadHasOpenedMeanwhile) {
  const std::size_t before = open_descriptors();
  {
    AlarmCamera camera;
    OvertakenIoStart driver;
    camera.introduce(driver, 5000);
    camera.set_inquiry("sensor", "Sensor1=1");
    EXPECT_EQ(driver.StartIoStreaming(), LIBD_OK);
    EXPECT_EQ(driver.AlarmDriver::StopIoStreaming(), LIBD_OK);
    EXPECT_EQ(camera.closed_streams(1), 1U);
  }
  EXPECT_TRUE(eventually([&] { return open_descriptors() == before; })) << open_descriptors() << ' ' << before;
}

}  // namespace
}  // namespace vexa_test
