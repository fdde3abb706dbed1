// Motion, presets and tours when memory is short.
#include <gtest/gtest.h>

#include <string>

#include "tests/device/ptz_reach.h"
#include "tests/support/failing_new.h"

namespace {

using vexa_test::AllocationFailure;
using vexa_test::command;
using vexa_test::inquiry;
using vexa_test::PtzDriver;
using vexa_test::PtzPlay;
using vexa_test::ScriptStep;

// Longer than what a text holds without memory, as are the texts below.
const std::string kLongText(40, 'n');

const char* const kLongPresetAnswer =
    "PresetName=1,A name that is longer than a text holds by itself&Tour=on&TourResume=on&TourRsmTime=30&"
    "TourASequence=1,2,0000000000000000000003&STour=on&STourResume=on&STourMaxRecordTime=00000000000000000120";

ELibDReturnCode read_presets(PtzDriver& driver) {
  std::vector<SLibDPresetInfo> presets;
  return driver.GetPresets(presets);
}

ELibDReturnCode read_tours(PtzDriver& driver) {
  SLibDCameraTourInfo info;
  return driver.GetCameraTourInfo(info);
}

ELibDReturnCode read_shadow_tours(PtzDriver& driver) {
  SLibDShadowTourInfo info;
  return driver.GetShadowTourInfo(info);
}

ELibDReturnCode read_control(PtzDriver& driver) {
  SLibDPTZControlInfo info;
  return driver.GetPTZControlInfo(info);
}

ELibDReturnCode read_fixed_control(PtzDriver& driver) {
  SLibDFixedPTZControlInfo info;
  return driver.GetFixedPTZControlInfo(info);
}

using PtzCall = ELibDReturnCode (*)(PtzDriver& driver);

/// A driver of a camera with two of each kind.
void give_two_of_each(PtzDriver& driver) {
  SLibDFixedPTZControlInfo& info = driver.m_FixedPTZControlInfo;
  info.presetCount = info.tourCount = info.shadowTourCount = 2;
  info.zoomSteps.resize(2);
  driver.m_FixedPTZControlInfoAvailable = true;
  driver.m_PTZControlInfo.brightMode = kLongText;
  driver.m_SavedTimeout = vexa_test::kPatientTimeout;
}

/// Lets each allocation of the call fail in turn; every failure is reported. The camera answers `step` when it is
/// asked.
/// @return how many allocations there are.
int failures_of(PtzCall call, const ScriptStep& step) {
  for (int nth = 0; nth < 1000; ++nth) {
    PtzPlay play({step});
    give_two_of_each(play.driver);
    ELibDReturnCode result = LIBD_OK;
    bool happened = false;
    {
      const AllocationFailure failure(nth);
      result = call(play.driver);
      happened = failure.happened();
    }
    EXPECT_EQ(result, happened ? LIBD_FAILED : LIBD_OK) << nth;
    if (!happened) return nth;
    EXPECT_EQ(vexa_test::text_of_latest_error(play.driver), "Cannot allocate memory") << nth;
  }
  return 1000;
}

TEST(PtzReading, FailsWhenAnyOneAllocationDoes) {
  for (const PtzCall read : {read_presets, read_tours, read_shadow_tours}) {
    const int failures = failures_of(read, inquiry("presetposition", kLongPresetAnswer));
    EXPECT_GT(failures, 5);
    EXPECT_LT(failures, 1000);
  }
}

TEST(PtzReading, OfTheDriversRecordsFailsWhenAnyOneAllocationDoes) {
  for (const PtzCall read : {read_control, read_fixed_control}) EXPECT_GT(failures_of(read, {}), 0);
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
    const int failures = failures_of(row.set, command(path + row.rest));
    EXPECT_GT(failures, 5) << row.rest;
    EXPECT_LT(failures, 1000) << row.rest;
  }
  EXPECT_GT(failures_of([](PtzDriver& d) { return d.SetPTZControlInfo(long_control); }, {}), 0);
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
