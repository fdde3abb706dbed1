// The list of pins that a camera has, its outputs, and its live alarm stream stopped.
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <climits>
#include <string>
#include <vector>

#include "tests/device/alarm_driver.h"
#include "tests/device/detection_records.h"
#include "tests/device/settings_exchange.h"

namespace vexa_test {
namespace {

class IoBox : public testing::Test {
 protected:
  IoBox() {
    driver_.m_FixedIoBoxInfo.inputCount = 2;
    driver_.m_FixedIoBoxInfo.outputCount = 1;
  }

  template <typename Call>
  ELibDReturnCode with(Script script, Call call) {
    ScriptedCamera camera(std::move(script));
    driver_.use(camera.host(), camera.port(), kPatientTimeout);
    const ELibDReturnCode result = call();
    EXPECT_EQ(camera.finish(), "");
    return result;
  }
  ELibDReturnCode ask(Script script, SLibDIoBoxInfo& info) {
    return with(std::move(script), [&] { return driver_.GetIoBoxInfo(info); });
  }

  AlarmDriver driver_;
};

TEST_F(IoBox, FixedPartIsNotSupportedUntilAModelClassHasFilledIt) {
  SLibDFixedIoBoxInfo info;
  info.inputCount = 77;
  EXPECT_EQ(driver_.GetFixedIoboxInfo(info), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(info.inputCount, 77);
}

TEST_F(IoBox, FixedPartIsHandedOutWhole) {
  driver_.m_FixedIoBoxInfoAvailable = true;
  driver_.m_FixedIoBoxInfo.flag27 = driver_.m_FixedIoBoxInfo.audioDetection = true;
  driver_.m_FixedIoBoxInfo.reserved12 = 12;
  SLibDFixedIoBoxInfo info;
  EXPECT_EQ(driver_.GetFixedIoboxInfo(info), LIBD_OK);
  EXPECT_EQ(info.inputCount, 2);
  EXPECT_EQ(info.outputCount, 1);
  EXPECT_TRUE(info.flag27 && info.audioDetection);
  EXPECT_EQ(info.reserved12, 12);
}

TEST_F(IoBox, WithoutDetectorsAsksNoCamera) {
  driver_.use(own_loopback(0), refusing_port(), kPatientTimeout);
  SLibDIoBoxInfo info;
  info.tamperLevel = 3;
  EXPECT_EQ(driver_.GetIoBoxInfo(info), LIBD_OK);
  EXPECT_EQ(rows_of(info.pins), (std::vector<PinRow>{{1, 0, 1, 0}, {2, 0, 1, 0}, {1, 1, 1, 0}}));
  EXPECT_EQ(info.tamperLevel, 3);
  EXPECT_EQ(driver_.latest_error(), "-102 from before");
}

TEST_F(IoBox, NumbersDetectorsBehindTheInputs) {
  driver_.m_FixedIoBoxInfo.tamperingDetection = driver_.m_FixedIoBoxInfo.audioDetection = true;
  SLibDIoBoxInfo info;
  EXPECT_EQ(
      ask({inquiry("system", "a=1&TamperingFunc=off&TamperingLevel=middle"), inquiry("audiodetection", "ADFunc=on")},
          info),
      LIBD_OK);
  EXPECT_EQ(rows_of(info.pins),
            (std::vector<PinRow>{{1, 0, 1, 0}, {2, 0, 1, 0}, {1, 1, 1, 0}, {3, 4, 0, 0}, {4, 5, 1, 0}}));
  EXPECT_EQ(info.tamperLevel, 2);
}

TEST_F(IoBox, GivesAudioTheFirstNumberOfACameraWithoutTampering) {
  driver_.m_FixedIoBoxInfo.audioDetection = true;
  SLibDIoBoxInfo info;
  EXPECT_EQ(ask({inquiry("audiodetection", "ADFunc=off")}, info), LIBD_OK);
  EXPECT_EQ(rows_of(info.pins).back(), (PinRow{3, 5, 0, 0}));
}

TEST_F(IoBox, TellsTheTamperLevelOrLeavesIt) {
  driver_.m_FixedIoBoxInfo.tamperingDetection = true;
  const struct {
    const char* answer;
    int enabled;
    int level;
  } rows[] = {{"TamperingFunc=on&TamperingLevel=low", 1, 1},
              {"TamperingFunc=off&TamperingLevel=high", 0, 3},
              {"TamperingLevel=extreme", 1, 0},
              {"TamperingFunc=maybe", 1, 7},
              {"nothing known", 1, 7}};
  for (const auto& row : rows) {
    SLibDIoBoxInfo info;
    info.tamperLevel = 7;
    EXPECT_EQ(ask({inquiry("system", row.answer)}, info), LIBD_OK);
    EXPECT_EQ(rows_of(info.pins).back(), (PinRow{3, 4, row.enabled, 0})) << row.answer;
    EXPECT_EQ(info.tamperLevel, row.level) << row.answer;
  }
}

TEST_F(IoBox, AppendsToTheListOfTheCaller) {
  SLibDIoBoxInfo info;
  EXPECT_EQ(driver_.GetIoBoxInfo(info), LIBD_OK);
  EXPECT_EQ(driver_.GetIoBoxInfo(info), LIBD_OK);
  EXPECT_EQ(rows_of(info.pins),
            (std::vector<PinRow>{{1, 0, 1, 0}, {2, 0, 1, 0}, {1, 1, 1, 0}, {1, 0, 1, 0}, {2, 0, 1, 0}, {1, 1, 1, 0}}));
}

TEST_F(IoBox, IsStoredWholeUnderTheDriversVmdType) {
  ASSERT_EQ(driver_.SetVMDtype(LIBD_VMD_VMF), LIBD_OK);
  SLibDIoBoxInfo info;
  info.reserved1 = 1;
  info.reserved3 = 3;
  info.reserved4 = 4;
  info.reserved5 = 5;
  info.detections1 = {marked_setting(1)};
  info.reserved7 = 7;
  info.reserved8 = 8;
  info.reserved9 = 9;
  info.reserved10 = 10;
  info.detections2 = {marked_setting(2), marked_setting(3)};
  info.reserved12 = 12;
  info.tamperLevel = 13;
  info.vmdType = 14;
  EXPECT_EQ(driver_.GetIoBoxInfo(info), LIBD_OK);
  EXPECT_EQ(info.vmdType, LIBD_VMD_VMF);
  const SLibDIoBoxInfo& kept = driver_.m_IoBoxInfo;
  EXPECT_EQ(
      (std::vector<int>{kept.reserved1, kept.reserved3, kept.reserved4, kept.reserved5, kept.reserved7, kept.reserved8,
                        kept.reserved9, kept.reserved10, kept.reserved12, kept.tamperLevel, kept.vmdType}),
      (std::vector<int>{1, 3, 4, 5, 7, 8, 9, 10, 12, 13, 1}));
  EXPECT_EQ(rows_of(kept.pins), rows_of(info.pins));
  EXPECT_EQ(numbers_of(kept.detections1), (std::vector<int>{1}));
  EXPECT_EQ(numbers_of(kept.detections2), (std::vector<int>{2, 3}));
  EXPECT_EQ(setting_rows(kept.detections2[1]), setting_rows(marked_setting(3)));
}

TEST_F(IoBox, OfARefusingCameraIsNotStored) {
  driver_.m_FixedIoBoxInfo.tamperingDetection = driver_.m_FixedIoBoxInfo.audioDetection = true;
  SLibDIoBoxInfo info;
  EXPECT_EQ(ask({refusal("/command/inquiry.cgi?inq=system")}, info), LIBD_UNAUTHORIZED);
  EXPECT_EQ(info.pins.size(), 3U);
  EXPECT_EQ(ask({inquiry("system", ""), refusal("/command/inquiry.cgi?inq=audiodetection")}, info), LIBD_UNAUTHORIZED);
  EXPECT_TRUE(driver_.m_IoBoxInfo.pins.empty());
}

TEST_F(IoBox, IsNotSetByTheHost) {
  SLibDIoBoxInfo info;
  EXPECT_EQ(driver_.SetIoBoxInfo(info), LIBD_NOT_SUPPORTED);
}

TEST_F(IoBox, OutputIsSwitchedByNumberAndState) {
  const struct {
    int number;
    int state;
    const char* path;
  } rows[] = {{2, 1, "alarmout2on"},
              {2, 0, "alarmout2off"},
              {1, -1, "alarmout1on"},
              {1, INT_MIN, "alarmout1on"},
              {0, 0, "alarmout0off"},
              {INT_MIN, 0, "alarmout-2147483648off"},
              {INT_MAX, 2, "alarmout2147483647on"}};
  for (const auto& row : rows) {
    SLibDPinInfo pin;
    pin.number = row.number;
    pin.state = row.state;
    pin.type = PIN_TYPE_AUDIO_DETECTION;  // whatever it is called
    EXPECT_EQ(
        with({command(std::string("/command/main.cgi?Trigger=") + row.path)}, [&] { return driver_.SetOutput(pin); }),
        LIBD_OK);
  }
}

TEST_F(IoBox, OutputTellsTheLatestErrorOfARefusingCamera) {
  SLibDPinInfo pin;
  pin.number = 1;
  EXPECT_EQ(with({refusal("/command/main.cgi?Trigger=alarmout1off")}, [&] { return driver_.SetOutput(pin); }),
            LIBD_UNAUTHORIZED);
}

class StopIoStreaming : public testing::Test {
 protected:
  StopIoStreaming() { driver_.m_PendingPins.resize(2); }
  ~StopIoStreaming() override { close(camera_end_); }

  void stream() {
    int ends[2];
    ASSERT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends), 0);
    driver_.m_IoStreamSocket = ends[0];
    camera_end_ = ends[1];
  }

  TestDriver driver_;
  int camera_end_ = -1;
};

TEST_F(StopIoStreaming, WithoutAStreamSendsNothingAndForgetsPendingPins) {
  driver_.use(own_loopback(0), refusing_port(), kPatientTimeout);
  EXPECT_EQ(driver_.StopIoStreaming(), LIBD_OK);
  EXPECT_TRUE(driver_.m_PendingPins.empty());
}

TEST_F(StopIoStreaming, ClosesTheStreamAndSwitchesTheCamerasOff) {
  ScriptedCamera camera({command("/command/system.cgi?AlarmData=off")});
  driver_.use(camera.host(), camera.port(), kPatientTimeout);
  stream();
  EXPECT_EQ(driver_.StopIoStreaming(), LIBD_OK);
  EXPECT_EQ(driver_.m_IoStreamSocket, -1);
  EXPECT_TRUE(driver_.m_PendingPins.empty());
  char nothing = 0;
  EXPECT_EQ(recv(camera_end_, &nothing, 1, MSG_DONTWAIT), 0);
  EXPECT_EQ(camera.finish(), "");
}

TEST_F(StopIoStreaming, GivesTheLatestErrorsCodeAndIsStoppedAllTheSame) {
  ScriptedCamera camera({refusal("/command/system.cgi?AlarmData=off")});
  driver_.use(camera.host(), camera.port(), kPatientTimeout);
  stream();
  EXPECT_EQ(driver_.StopIoStreaming(), LIBD_UNAUTHORIZED);
  EXPECT_EQ(driver_.m_IoStreamSocket, -1);
  EXPECT_EQ(camera.finish(), "");
}

}  // namespace
}  // namespace vexa_test
