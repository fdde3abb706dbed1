// Alarm pins, detection settings and the polled streams when memory is short.
#include <gtest/gtest.h>

#include <future>
#include <string>
#include <vector>

#include "tests/device/alarm_driver.h"
#include "tests/device/detection_records.h"
#include "tests/support/failing_new.h"

namespace vexa_test {
namespace {

using AlarmCall = ELibDReturnCode (*)(AlarmDriver&);

class AlarmShortage : public testing::Test {
 protected:
  AlarmShortage() {
    camera_.set_inquiry("system", "TamperingFunc=on&TamperingLevel=high");
    camera_.set_inquiry("audiodetection", "ADFunc=off");
    camera_.set_inquiry("sensor", "Sensor1=1&Sensor2=0");
    camera_.set_inquiry("objectdetection",
                        "PositionMode=current&ODPreDef=0&Od01Win1=on&Od01Win1Area=1,2,3,4&Od99ThresholdR=5");
  }

  void prepare(AlarmDriver& driver) {
    camera_.introduce(driver);
    SLibDFixedIoBoxInfo& box = driver.m_FixedIoBoxInfo;
    box.inputCount = 2;
    box.outputCount = 1;
    box.tamperingDetection = box.audioDetection = true;
  }

  void fail_each(const char* name, AlarmCall call) {
    SCOPED_TRACE(name);
    fails_at_every_allocation([&](Shortage& shortage) {
      AlarmDriver driver;
      prepare(driver);
      expect_failure_told(shortage, driver, [&] { return call(driver); });
    });
  }

  AlarmCamera camera_;
};

SLibDDetectionParam setting = marked_setting(1);

TEST_F(AlarmShortage, FailsEachRequest) {
  fail_each("GetIoBoxInfo", [](AlarmDriver& d) {
    SLibDIoBoxInfo info;
    return d.GetIoBoxInfo(info);
  });
  fail_each("SetOutput", [](AlarmDriver& d) {
    SLibDPinInfo pin;
    return d.SetOutput(pin);
  });
  fail_each("GetObjectDetectionSetting", [](AlarmDriver& d) {
    std::vector<SLibDDetectionParam> settings;
    auto mode = LIBD_POSITION_PRESET;
    return d.GetObjectDetectionSetting(settings, mode);
  });
  fail_each("SetDetectionParam", [](AlarmDriver& d) { return d.SetDetectionParam(setting); });
  fail_each("SetPositionMode", [](AlarmDriver& d) { return d.SetPositionMode(LIBD_POSITION_CURRENT); });
  fail_each("SetTamperingAlarm", [](AlarmDriver& d) { return d.SetTamperingAlarm(true, LIBD_TAMPER_LOW); });
  fail_each("SetAudioDetection", [](AlarmDriver& d) { return d.SetAudioDetection(true); });
  fail_each("StartModRawData", [](AlarmDriver& d) {
    const ELibDReturnCode result = d.StartModRawData();
    d.StopModRawData();
    return result;
  });
}

TEST_F(AlarmShortage, LeavesTheStoredRecordWhole) {
  fails_at_every_allocation([this](Shortage& shortage) {
    AlarmDriver driver;
    prepare(driver);
    driver.m_IoBoxInfo.reserved1 = 7;
    driver.m_IoBoxInfo.detections1 = {marked_setting(7)};
    SLibDIoBoxInfo info;
    info.reserved1 = 8;
    info.detections1 = {marked_setting(8), marked_setting(9)};
    expect_failure_told(shortage, driver, [&] { return driver.GetIoBoxInfo(info); });
    const SLibDIoBoxInfo& kept = driver.m_IoBoxInfo;
    EXPECT_EQ(kept.reserved1, shortage.failed() ? 7 : 8);
    EXPECT_EQ(kept.pins.size(), shortage.failed() ? 0U : 5U);
    EXPECT_EQ(numbers_of(kept.detections1), shortage.failed() ? (std::vector<int>{7}) : (std::vector<int>{8, 9}));
  });
}

// The starts wait for the camera to settle, hence all at once.
TEST_F(AlarmShortage, LeavesNoStreamThatFailedToStartOpen) {
  constexpr int kMost = 64;
  std::vector<std::future<bool>> starts;
  for (int nth = 0; nth < kMost; ++nth) {
    starts.push_back(std::async(std::launch::async, [this, nth] {
      AlarmDriver driver;
      prepare(driver);
      Shortage shortage(nth);
      expect_failure_told(shortage, driver, [&] { return driver.StartIoStreaming(); });
      EXPECT_EQ(driver.m_IoStreamSocket == -1, shortage.failed()) << nth;
      driver.StopIoStreaming();
      return shortage.failed();
    }));
  }
  int failed = 0;
  for (std::future<bool>& start : starts) failed += start.get() ? 1 : 0;
  EXPECT_GT(failed, 3);
  EXPECT_LT(failed, kMost);
}

TEST_F(AlarmShortage, LosesNoPartOfAStream) {
  StreamPair pair;
  AlarmDriver driver;
  prepare(driver);
  driver.read_alarms_from(pair, kPatientTimeout);
  pair.say(alarm_part("Sensor1=1&Sensor2=0"));
  std::vector<SLibDPinInfo> pins;
  Shortage shortage(0);
  expect_failure_told(shortage, driver, [&] { return driver.GetCurrentIoStatus(pins); });
  EXPECT_TRUE(shortage.failed());
  EXPECT_EQ(driver.GetCurrentIoStatus(pins), LIBD_OK);
  EXPECT_EQ(rows_of(pins), (std::vector<PinRow>{{1, 0, 1, 1}, {2, 0, 1, 0}}));
  driver.forget_streams();
}

}  // namespace
}  // namespace vexa_test
