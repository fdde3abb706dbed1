// New records of PTZ, I/O, detection and recordings.
#include <gtest/gtest.h>

#include <cstddef>
#include <type_traits>

#include "tests/contract/record_fields.h"

namespace {

using namespace contract;

TEST(Records, FixedPTZControlInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDFixedPTZControlInfo> made;
  const SLibDFixedPTZControlInfo& record = *made;
  expect_fields(record, {FIELD(reserved1, kNoItems), FIELD(noMoveSpeed, kFalse), FIELD(reserved3, kFalse),
                         FIELD(panTilt, "block of 27"), FIELD(reserved5, kZero), FIELD(zoom, "block of 9"),
                         FIELD(zoomSteps, kNoItems), FIELD(reserved8, kZero), FIELD(focus, "block of 6"),
                         FIELD(reserved10, kZero), FIELD(brightModes, kNoItems), FIELD(reserved12, kFalse),
                         FIELD(reserved13, kFalse), FIELD(dayNightModes, kNoItems), FIELD(presetCount, kZero),
                         FIELD(tourCount, kZero), FIELD(shadowTourCount, kZero)});
}

TEST(Records, FixedPanTiltInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDFixedPanTiltInfo> made;
  const SLibDFixedPanTiltInfo& record = *made;
  expect_fields(record, {FIELD(reserved1, kZero),         FIELD(panMaxSpeed, kZero),
                         FIELD(reserved3, kZero),         FIELD(reserved4, kZero),
                         FIELD(tiltMaxSpeed, kZero),      FIELD(reserved6, kZero),
                         FIELD(reserved7, kZero),         FIELD(horizontalWideAngle, kZero),
                         FIELD(reserved9, kZero),         FIELD(reserved10, kZero),
                         FIELD(verticalWideAngle, kZero), FIELD(reserved12, kZero),
                         FIELD(reserved13, kZero),        FIELD(panSpan, kZero),
                         FIELD(reserved15, kZero),        FIELD(reserved16, kZero),
                         FIELD(panAngleRange, kZero),     FIELD(reserved18, kZero),
                         FIELD(panOrigin, kZero),         FIELD(reserved20, kZero),
                         FIELD(tiltSpan, kZero),          FIELD(reserved22, kZero),
                         FIELD(reserved23, kZero),        FIELD(tiltAngleRange, kZero),
                         FIELD(reserved25, kZero),        FIELD(tiltOrigin, kZero),
                         FIELD(tiltOffset, kZero)});
}

TEST(Records, FixedZoomInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDFixedZoomInfo> made;
  const SLibDFixedZoomInfo& record = *made;
  expect_fields(record, {FIELD(minSpeed, kZero), FIELD(maxSpeed, kZero), FIELD(reserved3, kZero),
                         FIELD(minPosition, kZero), FIELD(reserved5, kZero), FIELD(reserved6, kZero),
                         FIELD(reserved7, kZero), FIELD(maxPosition, kZero), FIELD(reserved9, kZero)});
}

TEST(Records, FixedFocusInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDFixedFocusInfo> made;
  const SLibDFixedFocusInfo& record = *made;
  expect_fields(record, {FIELD(minSpeed, kZero), FIELD(maxSpeed, kZero), FIELD(reserved3, kZero),
                         FIELD(minPosition, kZero), FIELD(maxPosition, kZero), FIELD(reserved6, kZero)});
}

TEST(Records, PTZStatusHasTheStatedFieldsAndDefaults) {
  const Made<SLibDPTZStatus> made;
  const SLibDPTZStatus& record = *made;
  expect_fields(record, {FIELD(panPosition, kZero), FIELD(tiltPosition, kZero), FIELD(horizontalAngle, kZero),
                         FIELD(verticalAngle, kZero), FIELD(moving, kFalse)});
}

TEST(Records, PTZControlInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDPTZControlInfo> made;
  const SLibDPTZControlInfo& record = *made;
  expect_fields(
      record, {FIELD(reserved1, kZero), FIELD(reserved2, kEmpty), FIELD(reserved3, kZero), FIELD(reserved4, kFalse),
               FIELD(reserved5, kFalse), FIELD(brightMode, kEmpty), FIELD(reserved7, kZero), FIELD(reserved8, kEmpty),
               FIELD(reserved9, kZero), FIELD(reserved10, kEmpty), FIELD(reserved11, kZero), FIELD(reserved12, kEmpty),
               FIELD(reserved13, kZero)});
}

TEST(Records, PresetInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDPresetInfo> made;
  const SLibDPresetInfo& record = *made;
  expect_fields(record, {FIELD(index, kZero), FIELD(name, kEmpty)});
}

TEST(Records, CameraTourInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDCameraTourInfo> made;
  const SLibDCameraTourInfo& record = *made;
  expect_fields(record, {FIELD(enabled, kFalse), FIELD(resumeTime, kZero), FIELD(tours, kNoEntries)});
}

TEST(Records, CameraTourEachSettingHasTheStatedFieldsAndDefaults) {
  const Made<SLibDCameraTourEachSetting> made;
  const SLibDCameraTourEachSetting& record = *made;
  expect_fields(record, {FIELD(enabled, kFalse), FIELD(sequence, kNoItems), FIELD(stayTime, "i32 10"),
                         FIELD(reserved4, kZero), FIELD(speed, "i32 24")});
}

TEST(Records, ShadowTourInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDShadowTourInfo> made;
  const SLibDShadowTourInfo& record = *made;
  expect_fields(record, {FIELD(enabled, kFalse), FIELD(resumeTime, kZero), FIELD(maxRecordTime, kZero),
                         FIELD(tours, kNoEntries)});
}

TEST(Records, ShadowTourEachSettingHasTheStatedFieldsAndDefaults) {
  const Made<SLibDShadowTourEachSetting> made;
  const SLibDShadowTourEachSetting& record = *made;
  expect_fields(record, {FIELD(enabled, kFalse), FIELD(reserved2, kZero), FIELD(recordedTime, kZero)});
}

TEST(Records, PinInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDPinInfo> made;
  const SLibDPinInfo& record = *made;
  expect_fields(record, {FIELD(number, kZero), FIELD(type, kZero), FIELD(enabled, kFalse), FIELD(state, kZero),
                         FIELD(reservedValue, kZero), FIELD(reservedFlag, kFalse)});
}

TEST(Records, IoBoxInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDIoBoxInfo> made;
  const SLibDIoBoxInfo& record = *made;
  expect_fields(
      record, {FIELD(reserved1, kZero), FIELD(pins, kNoItems), FIELD(reserved3, kZero), FIELD(reserved4, kZero),
               FIELD(reserved5, kZero), FIELD(detections1, kNoItems), FIELD(reserved7, kZero), FIELD(reserved8, kZero),
               FIELD(reserved9, kZero), FIELD(reserved10, kZero), FIELD(detections2, kNoItems),
               FIELD(reserved12, kZero), FIELD(tamperLevel, kZero), FIELD(vmdType, kZero)});
}

TEST(Records, FixedIoBoxInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDFixedIoBoxInfo> made;
  const SLibDFixedIoBoxInfo& record = *made;
  expect_fields(record, {FIELD(inputCount, kZero),
                         FIELD(outputCount, kZero),
                         FIELD(flag8, kFalse),
                         FIELD(videoDetection, kFalse),
                         FIELD(flag10, kFalse),
                         FIELD(flag11, kFalse),
                         FIELD(reserved3, kZero),
                         FIELD(reserved4, kZero),
                         FIELD(reserved5, kZero),
                         FIELD(flag24, kFalse),
                         FIELD(flag25, kFalse),
                         FIELD(flag26, kFalse),
                         FIELD(flag27, kFalse),
                         FIELD(reserved7, kZero),
                         FIELD(reserved8, kZero),
                         FIELD(reserved9, kZero),
                         FIELD(tamperingDetection, kFalse),
                         FIELD(audioDetection, kFalse),
                         FIELD(flag42, kFalse),
                         FIELD(flag43, kFalse),
                         FIELD(reserved11, kZero),
                         FIELD(reserved12, kZero)});
}

TEST(Records, DetectionParamHasTheStatedFieldsAndDefaults) {
  const Made<SLibDDetectionParam> made;
  const SLibDDetectionParam& record = *made;
  expect_fields(record, {FIELD(number, "i32 -1"), FIELD(reserved2, "i32 -1"), FIELD(windows, "4 windows")});
}

TEST(Records, DetectionWindowHasTheStatedFieldsAndDefaults) {
  const Made<SLibDDetectionWindow> made;
  const SLibDDetectionWindow& record = *made;
  expect_fields(record, {FIELD(area, kNoItems), FIELD(enabled, "i32 -1"), FIELD(mode, "i32 -1"),
                         FIELD(minObjectWidth, kZero), FIELD(minObjectHeight, kZero), FIELD(maxObjectWidth, kZero),
                         FIELD(maxObjectHeight, kZero), FIELD(sensitivity, "i32 -1")});
}

TEST(Records, RawMDFrameInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDRawMDFrameInfo> made;
  const SLibDRawMDFrameInfo& record = *made;
  expect_fields(record, {FIELD(window1, kZero), FIELD(window2, kZero), FIELD(window3, kZero), FIELD(window4, kZero)});
}

TEST(Records, EdgeStorageModeHasTheStatedFieldsAndDefaults) {
  const Made<SLibDEdgeStorageMode> made;
  const SLibDEdgeStorageMode& record = *made;
  expect_fields(record, {FIELD(enabled, kFalse), FIELD(imageNumber, kZero), FIELD(alarmTime1, kZero),
                         FIELD(alarmTime2, kZero), FIELD(watchAddress, kEmpty)});
}

TEST(Records, EdgeStorageRecordHasTheStatedFieldsAndDefaults) {
  const Made<SLibDEdgeStorageRecord> made;
  const SLibDEdgeStorageRecord& record = *made;
  expect_fields(record,
                {FIELD(streamName, kEmpty), FIELD(start, "i64 0"), FIELD(end, "i64 0"), FIELD(imageCodec, kEmpty),
                 FIELD(imageSize, kEmpty), FIELD(frameRate, kZero), FIELD(bitRate, kZero), FIELD(quality, kZero),
                 FIELD(audioCodec, kEmpty), FIELD(size, kZero), FIELD(status, kEmpty)});
}

TEST(Records, EdgeStorageRecordListHasTheStatedFieldsAndDefaults) {
  const Made<SLibDEdgeStorageRecordList> made;
  const SLibDEdgeStorageRecordList& record = *made;
  expect_fields(record, {FIELD(records, kNoItems)});
}

TEST(Records, EdgeStorageStreamingInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDEdgeStorageStreamingInfo> made;
  const SLibDEdgeStorageStreamingInfo& record = *made;
  expect_fields(record, {FIELD(streamName, kEmpty), FIELD(codecName, kEmpty), FIELD(scale, "i32 1")});
}

TEST(Records, TheAreaOfADetectionWindowHasRoomFor32Points) {
  EXPECT_GE(SLibDDetectionWindow().area.capacity(), 32U);
  for (const SLibDDetectionWindow& window : SLibDDetectionParam().windows) EXPECT_GE(window.area.capacity(), 32U);
}

TEST(Records, ACopyOfADetectionParamHasAreasOfItsOwn) {
  SLibDDetectionParam original;
  for (SLibDDetectionWindow& window : original.windows) window.area = {{1, 2}, {3, 4}};
  const SLibDDetectionParam copy = original;
  for (SLibDDetectionWindow& window : original.windows) window.area.clear();
  for (const SLibDDetectionWindow& window : copy.windows) {
    ASSERT_EQ(window.area.size(), 2U);
    EXPECT_EQ(window.area[1].x, 3);
    EXPECT_EQ(window.area[1].y, 4);
  }
}

struct FlagPlace {
  const char* name;
  std::size_t actual;
  std::size_t expected;
};

TEST(Records, TheFlagsOfTheFixedIoBoxStandAtTheirBytes) {
  using Info = SLibDFixedIoBoxInfo;
  const FlagPlace places[] = {
      {"inputCount", offsetof(Info, inputCount), 0},
      {"outputCount", offsetof(Info, outputCount), 4},
      {"flag8", offsetof(Info, flag8), 8},
      {"videoDetection", offsetof(Info, videoDetection), 9},
      {"flag24", offsetof(Info, flag24), 24},
      {"tamperingDetection", offsetof(Info, tamperingDetection), 40},
      {"audioDetection", offsetof(Info, audioDetection), 41},
      {"flag42", offsetof(Info, flag42), 42},
      {"reserved12", offsetof(Info, reserved12), 48},
  };
  for (const FlagPlace& place : places) EXPECT_EQ(place.actual, place.expected) << place.name;
  EXPECT_EQ(sizeof(Info), 52U);
}

static_assert(std::is_trivially_copyable_v<SLibDZoomRatioInt> && std::is_trivially_copyable_v<SLibDDayNightModeInfo> &&
                  std::is_trivially_copyable_v<SLibDCommonPosition> &&
                  std::is_trivially_copyable_v<SLibDFixedIoBoxInfo>,
              "hosts copy these as plain data");

}  // namespace
