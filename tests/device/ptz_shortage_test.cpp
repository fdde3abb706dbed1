// Presets and tours when memory is short.
#include <gtest/gtest.h>

#include <string>

#include "tests/device/ptz_reach.h"
#include "tests/support/failing_new.h"

namespace {

using vexa_test::AllocationFailure;
using vexa_test::inquiry;
using vexa_test::PtzDriver;
using vexa_test::PtzPlay;

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

TEST(PtzReading, FailsWhenAnyOneAllocationDoes) {
  for (const auto read : {read_presets, read_tours, read_shadow_tours}) {
    bool happened = true;
    int failures = 0;
    for (int nth = 0; happened; ++nth) {
      PtzPlay play({inquiry("presetposition", kLongPresetAnswer)});
      SLibDFixedPTZControlInfo& info = play.driver.m_FixedPTZControlInfo;
      info.presetCount = info.tourCount = info.shadowTourCount = 2;
      ELibDReturnCode result = LIBD_OK;
      {
        const AllocationFailure failure(nth);
        result = read(play.driver);
        happened = failure.happened();
      }
      EXPECT_EQ(result, happened ? LIBD_FAILED : LIBD_OK) << nth;
      if (happened) {
        EXPECT_EQ(vexa_test::text_of_latest_error(play.driver), "Cannot allocate memory") << nth;
      }
      if (happened) ++failures;
      ASSERT_LT(nth, 1000);
    }
    EXPECT_GT(failures, 5);
  }
}

}  // namespace
