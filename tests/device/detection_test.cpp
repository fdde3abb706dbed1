// Detection settings and the switches of the detectors, on the wire.
#include "device/cgi/detection_text.h"

#include <gtest/gtest.h>

#include <climits>
#include <string>
#include <utility>
#include <vector>

#include "tests/device/alarm_driver.h"
#include "tests/device/detection_records.h"
#include "tests/support/failing_new.h"

namespace vexa_test {
namespace {

using DetectionSettings = std::vector<SLibDDetectionParam>;

constexpr auto kUntouchedPosition = static_cast<ELibDPositionMode>(55);

class Detection : public testing::Test {
 protected:
  Detection() { driver_.use(own_loopback(0), refusing_port(), kPatientTimeout); }

  template <typename Call>
  ELibDReturnCode with(Script script, Call call) {
    ScriptedCamera camera(std::move(script));
    driver_.use(camera.host(), camera.port(), kPatientTimeout);
    const ELibDReturnCode result = call();
    EXPECT_EQ(camera.finish(), "");
    EXPECT_EQ(driver_.timeout(), kPatientTimeout);
    return result;
  }
  ELibDReturnCode ask(Script script) {
    return with(std::move(script), [this] { return driver_.GetObjectDetectionSetting(settings_, mode_); });
  }
  ELibDReturnCode set(SLibDDetectionParam param, Script script) {
    return with(std::move(script), [&] { return driver_.SetDetectionParam(param); });
  }
  /// Sets without a camera in reach; fails the test when it is turned to.
  ELibDReturnCode set_unsent(SLibDDetectionParam param) {
    driver_.soil_latest_error();
    const ELibDReturnCode result = driver_.SetDetectionParam(param);
    EXPECT_EQ(driver_.latest_error(), "-102 from before");
    return result;
  }

  AlarmDriver driver_;
  DetectionSettings settings_ = DetectionSettings(3);
  ELibDPositionMode mode_ = kUntouchedPosition;
};

SLibDDetectionParam lod_setting(int size, int sensitivity) {
  SLibDDetectionParam param;
  param.windows[0].minObjectWidth = size;
  param.windows[0].sensitivity = sensitivity;
  return param;
}

TEST_F(Detection, OfAnLodCameraIsReadAsSeventeenSettings) {
  driver_.m_LodDetection = true;
  EXPECT_EQ(ask({inquiry("lod", "LODMinObjectSize=middle&LODSensitivity=40")}), LIBD_OK);
  ASSERT_EQ(settings_.size(), 17U);
  EXPECT_EQ(setting_rows(settings_[16]), setting_rows(lod_setting(1, 40)));
  EXPECT_EQ(mode_, kUntouchedPosition);
}

TEST_F(Detection, OfAnLodCameraThatTellsNoKnownSizeFailsAndEmptiesTheList) {
  driver_.m_LodDetection = true;
  for (const char* answer :
       {"LODMinObjectSize=vast&LODSensitivity=40", "LODMinObjectSize=large&LODSensitivity=x", ""}) {
    settings_.resize(3);
    EXPECT_EQ(ask({inquiry("lod", answer)}), LIBD_FAILED) << answer;
    EXPECT_TRUE(settings_.empty());
  }
}

TEST_F(Detection, OfARefusingCameraLeavesTheList) {
  for (const bool lod : {true, false}) {
    driver_.m_LodDetection = lod;
    const std::string path = std::string("/command/inquiry.cgi?inq=") + (lod ? "lod" : "objectdetection");
    EXPECT_EQ(ask({refusal(path)}), LIBD_UNAUTHORIZED);
    EXPECT_EQ(settings_.size(), 3U);
    EXPECT_EQ(mode_, kUntouchedPosition);
  }
}

TEST_F(Detection, OfTheCurrentViewAloneIsOneSettingAndItsMode) {
  EXPECT_EQ(ask({inquiry("objectdetection", "PositionMode=current&ODPreDef=0&Od99Win1=on&Od99ThresholdG=12")}),
            LIBD_OK);
  EXPECT_EQ(mode_, LIBD_POSITION_CURRENT);
  ASSERT_EQ(numbers_of(settings_), std::vector<int>{99});
  EXPECT_EQ(settings_[0].windows[0].enabled, 1);
  EXPECT_EQ(settings_[0].windows[3].sensitivity, 12);
}

TEST_F(Detection, IsGroupedByNumberOnlyWhenTheCameraHasPresets) {
  const std::string answer = "PositionMode=preset&ODPreDef=0&Od1Win1=on&Od2Win1=on";
  EXPECT_EQ(ask({inquiry("objectdetection", answer)}), LIBD_OK);
  EXPECT_TRUE(settings_.empty());
  EXPECT_EQ(mode_, LIBD_POSITION_PRESET);
  driver_.m_FixedPTZControlInfo.presetCount = 16;
  EXPECT_EQ(ask({inquiry("objectdetection", answer)}), LIBD_OK);
  EXPECT_EQ(numbers_of(settings_), std::vector<int>{1});
}

TEST_F(Detection, WithoutModeOrItemsLeavesTheModeAndEmptiesTheList) {
  EXPECT_EQ(ask({inquiry("objectdetection", "nothing=known")}), LIBD_OK);
  EXPECT_EQ(mode_, kUntouchedPosition);
  EXPECT_TRUE(settings_.empty());
}

TEST_F(Detection, IsReadFromAnAnswerAsLongAsItMayBe) {
  driver_.m_FixedPTZControlInfo.presetCount = 1;
  std::string answer = "ODPreDef=0";
  for (int i = 0; answer.size() < 524200; ++i) answer += i % 2 == 0 ? "&Od1Mode=a" : "&Od2Mode=bb";
  EXPECT_EQ(ask({inquiry("objectdetection", answer + "&Od99Mode=c&" + std::string(5000, 'x'))}), LIBD_OK);
  EXPECT_GT(settings_.size(), 1000U);
}

TEST_F(Detection, ThatMemoryDoesNotHoldFails) {
  driver_.m_LodDetection = true;
  fails_at_every_allocation(
      [this](Shortage& shortage) {
        ScriptedCamera camera({inquiry("lod", "LODMinObjectSize=middle&LODSensitivity=40")});
        driver_.use(camera.host(), camera.port(), kPatientTimeout);
        expect_failure_told(shortage, driver_, [this] { return driver_.GetObjectDetectionSetting(settings_, mode_); });
      },
      3);
}

TEST_F(Detection, OfAnLodCameraIsSetByOneRequest) {
  driver_.m_LodDetection = true;
  const struct {
    int size;
    int sensitivity;
    const char* path;
  } rows[] = {{0, 1, "LODMinObjectSize=small&LODSensitivity=1"},
              {1, 40, "LODMinObjectSize=middle&LODSensitivity=40"},
              {2, 100, "LODMinObjectSize=large&LODSensitivity=100"}};
  for (const auto& row : rows) {
    const std::string path = std::string("/command/lod.cgi?") + row.path;
    EXPECT_EQ(set(lod_setting(row.size, row.sensitivity), {command(path)}), LIBD_OK);
    EXPECT_EQ(set(lod_setting(row.size, row.sensitivity), {refusal(path)}), LIBD_UNAUTHORIZED);
  }
}

TEST_F(Detection, OfAnLodCameraIsRefusedOutsideSizesAndSensitivities) {
  driver_.m_LodDetection = true;
  for (const int size : {-1, 3, INT_MAX, INT_MIN}) EXPECT_EQ(set_unsent(lod_setting(size, 50)), LIBD_INVALID_ARGUMENT);
  for (const int sensitivity : {INT_MIN, -1, 0, 101, INT_MAX}) {
    EXPECT_EQ(set_unsent(lod_setting(1, sensitivity)), LIBD_INVALID_ARGUMENT) << sensitivity;
  }
}

Script three_requests(const SLibDDetectionParam& param) {
  return {command(vexa::object_size_request(param)), command(vexa::first_windows_request(param)),
          command(vexa::last_windows_request(param))};
}

TEST_F(Detection, OfObjectsIsSetByThreeRequests) {
  const std::string cgi = "/command/objectdetection.cgi?";
  EXPECT_EQ(set(marked_setting(99), {command(cgi + "Od99ThresholdR=42&Od99ThresholdG=42&Od99ThresholdB=42"
                                                   "&Od99MinObjectSize=101,102&Od99MaxObjectSize=103,104"),
                                     command(cgi + "Od99Win1=off&Od99Win1Area=10,11,12,13&Od99Win1Mode=mask"
                                                   "&Od99Win2=on&Od99Win2Area=17,18,19,20&Od99Win2Mode=mask"),
                                     command(cgi + "Od99Win3=off&Od99Win3Area=24,25,26,27&Od99Win3Mode=det"
                                                   "&Od99Win4=on&Od99Win4Area=31,32,33,34&Od99Win4Mode=mask")}),
            LIBD_OK);
}

TEST_F(Detection, OfObjectsWaitsTenSecondsForEachAnswer) {
  std::vector<int> timeouts;
  const auto noting = [&](ScriptStep step) {
    step.meanwhile = [&] { timeouts.push_back(driver_.timeout()); };
    return step;
  };
  const SLibDDetectionParam param = marked_setting(5);
  EXPECT_EQ(set(param,
                {noting(command(vexa::object_size_request(param))), noting(command(vexa::first_windows_request(param))),
                 noting(command(vexa::last_windows_request(param)))}),
            LIBD_OK);
  EXPECT_EQ(ask({noting(inquiry("objectdetection", "ODPreDef=0"))}), LIBD_OK);
  EXPECT_EQ(timeouts, (std::vector<int>{10000, 10000, 10000, 10000}));
  timeouts.clear();
  driver_.m_LodDetection = true;
  EXPECT_EQ(ask({noting(inquiry("lod", "LODMinObjectSize=small&LODSensitivity=1"))}), LIBD_OK);
  EXPECT_EQ(timeouts, std::vector<int>{kPatientTimeout});
}

TEST_F(Detection, OfObjectsSendsNoMoreAfterARefusal) {
  const SLibDDetectionParam param = marked_setting(1);
  for (std::size_t refused = 0; refused < 3; ++refused) {
    Script script = three_requests(param);
    script.resize(refused + 1);
    script.back().answer = "HTTP/1.0 401 Unauthorized\r\n\r\n";
    EXPECT_EQ(set(param, std::move(script)), LIBD_UNAUTHORIZED) << refused;
  }
}

TEST_F(Detection, OfObjectsIsRefusedUnlessEachAreaHasTwoPoints) {
  for (std::size_t window = 0; window < 4; ++window) {
    for (const std::size_t points : {0U, 1U, 3U}) {
      SLibDDetectionParam param = marked_setting(1);
      param.windows[window].area.resize(points);
      EXPECT_EQ(set_unsent(param), LIBD_INVALID_ARGUMENT);
      int socket = 7;
      EXPECT_EQ(driver_.SetObjectDetectionParameter(param, socket), LIBD_INVALID_ARGUMENT);
      EXPECT_EQ(socket, 7);
    }
  }
}

TEST_F(Detection, SenderHandsOutTheSocketOfItsLastRequest) {
  SLibDDetectionParam param = marked_setting(5);
  int socket = -7;
  EXPECT_EQ(with(three_requests(param), [&] { return driver_.SetObjectDetectionParameter(param, socket); }), LIBD_OK);
  EXPECT_GE(socket, 0);
  EXPECT_EQ(with({refusal(vexa::object_size_request(param))},
                 [&] { return driver_.SetObjectDetectionParameter(param, socket); }),
            LIBD_UNAUTHORIZED);
  EXPECT_EQ(socket, -1);
}

TEST_F(Detection, ChecksLookAtTheFirstWindow) {
  SLibDDetectionParam param = lod_setting(2, 100);
  std::string text = "before";
  EXPECT_EQ(driver_.CheckDetectionParamSensitivity(param), LIBD_OK);
  EXPECT_EQ(driver_.ConverObjectWidthValueToString(param, text), LIBD_OK);
  EXPECT_EQ(text, "large");
  param = lod_setting(3, 0);
  EXPECT_EQ(driver_.CheckDetectionParamSensitivity(param), LIBD_INVALID_ARGUMENT);
  EXPECT_EQ(driver_.ConverObjectWidthValueToString(param, text), LIBD_INVALID_ARGUMENT);
  EXPECT_EQ(text, "large");
  EXPECT_EQ(driver_.CheckDetectionParamDetectionArea(param), LIBD_INVALID_ARGUMENT);
}

TEST_F(Detection, PositionModeIsCurrentForAnyModeButPreset) {
  const struct {
    int mode;
    const char* word;
  } rows[] = {{0, "preset"}, {99, "current"}, {1, "current"}, {-1, "current"}, {INT_MIN, "current"}};
  for (const auto& row : rows) {
    const std::string path = std::string("/command/objectdetection.cgi?PositionMode=") + row.word;
    const auto call = [&] { return driver_.SetPositionMode(static_cast<ELibDPositionMode>(row.mode)); };
    EXPECT_EQ(with({command(path)}, call), LIBD_OK);
    EXPECT_EQ(with({refusal(path)}, call), LIBD_UNAUTHORIZED);
  }
}

TEST_F(Detection, TamperingIsSwitchedWithItsLevel) {
  const struct {
    bool on;
    int level;
    const char* items;
  } rows[] = {{true, 1, "TamperingFunc=on&TamperingLevel=low"},
              {true, 2, "TamperingFunc=on&TamperingLevel=middle"},
              {false, 3, "TamperingFunc=off&TamperingLevel=high"}};
  for (const auto& row : rows) {
    const std::string path = std::string("/command/system.cgi?") + row.items;
    const auto call = [&] { return driver_.SetTamperingAlarm(row.on, static_cast<ELibDTamperLevel>(row.level)); };
    EXPECT_EQ(with({command(path)}, call), LIBD_OK);
    EXPECT_EQ(driver_.m_IoBoxInfo.tamperLevel, row.level);
  }
}

TEST_F(Detection, TamperLevelIsStoredAlthoughTheCameraRefuses) {
  EXPECT_EQ(with({refusal("/command/system.cgi?TamperingFunc=on&TamperingLevel=high")},
                 [&] { return driver_.SetTamperingAlarm(true, LIBD_TAMPER_HIGH); }),
            LIBD_UNAUTHORIZED);
  EXPECT_EQ(driver_.m_IoBoxInfo.tamperLevel, 3);
}

TEST_F(Detection, TamperLevelsThatAreNoneAreRefused) {
  driver_.soil_latest_error();
  for (const int level : {INT_MIN, -1, 0, 4, INT_MAX}) {
    EXPECT_EQ(driver_.SetTamperingAlarm(true, static_cast<ELibDTamperLevel>(level)), LIBD_INVALID_ARGUMENT) << level;
  }
  EXPECT_EQ(driver_.m_IoBoxInfo.tamperLevel, 0);
  EXPECT_EQ(driver_.latest_error(), "-102 from before");
}

TEST_F(Detection, AudioIsSwitchedWhenTheCameraHasIt) {
  driver_.soil_latest_error();
  EXPECT_EQ(driver_.SetAudioDetection(true), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(driver_.latest_error(), "-102 from before");
  driver_.m_FixedIoBoxInfo.audioDetection = true;
  for (const bool on : {true, false}) {
    const std::string path = std::string("/command/audiodetection.cgi?ADFunc=") + (on ? "on" : "off");
    EXPECT_EQ(with({command(path)}, [&] { return driver_.SetAudioDetection(on); }), LIBD_OK);
    EXPECT_EQ(with({refusal(path)}, [&] { return driver_.SetAudioDetection(on); }), LIBD_UNAUTHORIZED);
  }
}

TEST_F(Detection, VmdTypeIsStoredWithoutARequest) {
  driver_.soil_latest_error();
  for (const int type : {1, 0}) {
    EXPECT_EQ(driver_.SetVMDtype(static_cast<ELibDVMDType>(type)), LIBD_OK);
    EXPECT_EQ(driver_.m_IoBoxInfo.vmdType, type);
  }
  ASSERT_EQ(driver_.SetVMDtype(LIBD_VMD_VMF), LIBD_OK);
  for (const int type : {2, 3, -1, INT_MAX, INT_MIN}) {
    EXPECT_EQ(driver_.SetVMDtype(static_cast<ELibDVMDType>(type)), LIBD_INVALID_ARGUMENT) << type;
  }
  EXPECT_EQ(driver_.m_IoBoxInfo.vmdType, 1);
  EXPECT_EQ(driver_.latest_error(), "-102 from before");
}

}  // namespace
}  // namespace vexa_test
