// Motion, presets and tours when memory is short.
#include <gtest/gtest.h>

#include <string>

#include "tests/device/ptz_reach.h"
#include "tests/support/failing_new.h"

namespace vexa_test {
namespace {

// Longer than what a text holds without memory, as are the texts below.
const std::string kLongText(40, 'n');

const char* const kLongPresetAnswer =
    "PresetName=1,A name that is longer than a text holds by itself&Tour=on&TourResume=on&TourRsmTime=30&"
    "TourASequence=1,2,0000000000000000000003&STour=on&STourResume=on&STourMaxRecordTime=00000000000000000120";

/// Reads into a record of the host's.
template <typename Record, ELibDReturnCode (CVexaCommon::*kRead)(Record&)>
ELibDReturnCode read_into(PtzDriver& driver) {
  Record record;
  return (driver.*kRead)(record);
}

using PtzCall = ELibDReturnCode (*)(PtzDriver& driver);

/// A driver of a camera with two of each kind.
void give_two_of_each(PtzDriver& driver) {
  SLibDFixedPTZControlInfo& info = driver.m_FixedPTZControlInfo;
  info.presetCount = info.tourCount = info.shadowTourCount = 2;
  info.zoomSteps.resize(2);
  driver.m_FixedPTZControlInfoAvailable = true;
  driver.m_PTZControlInfo.brightMode = kLongText;
  driver.m_SavedTimeout = kPatientTimeout;
}

/// Lets each allocation of the call fail in turn; every failure is reported. The camera says `step` when it is asked.
void expect_each_failure_told(PtzCall call, const ScriptStep& step, int few = 0) {
  fails_at_every_allocation(
      [&](Shortage& shortage) {
        PtzPlay play({step}, Ends::kAnywhere);
        give_two_of_each(play.driver);
        expect_failure_told(shortage, play.driver, [&] { return call(play.driver); });
      },
      few);
}

TEST(PtzReading, FailsWhenAnyOneAllocationDoes) {
  const PtzCall calls[] = {read_into<std::vector<SLibDPresetInfo>, &CVexaCommon::GetPresets>,
                           read_into<SLibDCameraTourInfo, &CVexaCommon::GetCameraTourInfo>,
                           read_into<SLibDShadowTourInfo, &CVexaCommon::GetShadowTourInfo>};
  for (const PtzCall call : calls) {
    expect_each_failure_told(call, inquiry("presetposition", kLongPresetAnswer), 5);
  }
}

TEST(PtzReading, OfTheDriversRecordsFailsWhenAnyOneAllocationDoes) {
  const PtzCall calls[] = {read_into<SLibDPTZControlInfo, &CVexaCommon::GetPTZControlInfo>,
                           read_into<SLibDFixedPTZControlInfo, &CVexaCommon::GetFixedPTZControlInfo>};
  for (const PtzCall call : calls) expect_each_failure_told(call, {});
}

// What is set is made before memory runs short.
SLibDPresetInfo long_preset;
SLibDCameraTourInfo two_tours;
SLibDShadowTourInfo two_shadow_tours;
SLibDPTZControlInfo long_control;

TEST(PtzSetting, FailsWhenAnyOneAllocationDoes) {
  long_preset.name = kLongText;
  two_tours.tours[1].sequence = two_tours.tours[2].sequence = {1, 2};
  two_shadow_tours.tours[1] = two_shadow_tours.tours[2] = {};
  long_control.brightMode = kLongText;
  const std::string path = "/command/presetposition.cgi?";
  const std::string tour = "&TourB=off&TourBSequence=1,2&TourBStaytime=10&TourBPeriod=always&TourBSpeed=24";
  const struct {
    PtzCall set;
    std::string rest;
  } rows[] = {
      {[](PtzDriver& d) { return d.SetPreset(long_preset); }, "PresetSet=1," + kLongText + ",on"},
      {[](PtzDriver& d) { return d.SetCameraTourInfo(two_tours); },
       "Tour=off&TourResume=off&TourA=off&TourASequence=1,2&TourAStaytime=10&TourAPeriod=always&TourASpeed=24" + tour},
      {[](PtzDriver& d) { return d.SetShadowTourInfo(two_shadow_tours); },
       "STour=off&STourResume=off&STourA=off&STourAPeriod=always&STourB=off&STourBPeriod=always"},
      {[](PtzDriver& d) { return d.StartShadowTour(1); }, "STour=on&STourA=on&STourB=off"}};
  for (const auto& row : rows) {
    SCOPED_TRACE(row.rest);
    expect_each_failure_told(row.set, command(path + row.rest), 5);
  }
  expect_each_failure_told([](PtzDriver& d) { return d.SetPTZControlInfo(long_control); }, {});
}

TEST(PtzReading, OfThePositionNeedsNoMemory) {
  PtzDriver driver;
  driver.m_ZoomRatios = {{1, 0}};
  driver.m_FixedPTZControlInfo.panTilt.horizontalWideAngle = driver.m_FixedPTZControlInfo.panTilt.verticalWideAngle = 1;
  driver.tell_position("CamPos: 111006400C81000M");
  SLibDPTZStatus status;
  const AllocationFailure failure(0);
  EXPECT_EQ(driver.GetCurrentPosition(status), LIBD_OK);
  EXPECT_FALSE(failure.happened());
}

}  // namespace
}  // namespace vexa_test
