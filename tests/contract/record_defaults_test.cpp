// New records of system, video and audio.
#include <gtest/gtest.h>

#include <string>

#include "tests/contract/record_fields.h"

namespace {

using namespace contract;

TEST(Records, CommonParameterIntHasTheStatedFieldsAndDefaults) {
  const Made<SLibDCommonParameterInt> made;
  const SLibDCommonParameterInt& record = *made;
  expect_fields(record, {FIELD(label, kEmpty), FIELD(value, kZero)});
}

TEST(Records, ZoomRatioIntHasTheStatedFieldsAndDefaults) {
  const Made<SLibDZoomRatioInt> made;
  const SLibDZoomRatioInt& record = *made;
  expect_fields(record, {FIELD(ratio, kZero), FIELD(position, kZero)});
}

TEST(Records, DayNightModeInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDDayNightModeInfo> made;
  const SLibDDayNightModeInfo& record = *made;
  expect_fields(record, {FIELD(mode, kZero)});
}

TEST(Records, BrightModeInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDBrightModeInfo> made;
  const SLibDBrightModeInfo& record = *made;
  expect_fields(record, {FIELD(name, kEmpty), FIELD(shutterSpeeds, kNoItems), FIELD(irisPositions, kNoItems),
                         FIELD(reserved4, kNoItems)});
}

TEST(Records, AudioCodecInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDAudioCodecInfo> made;
  const SLibDAudioCodecInfo& record = *made;
  expect_fields(record, {FIELD(name, kEmpty), FIELD(bitRates, kNoItems), FIELD(frameSizes, kNoItems),
                         FIELD(samplingRates, kNoItems)});
}

TEST(Records, ResolutionInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDResolutionInfo> made;
  const SLibDResolutionInfo& record = *made;
  expect_fields(record, {FIELD(text, kEmpty), FIELD(width, kZero), FIELD(height, kZero)});
}

TEST(Records, VideoCodecInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDVideoCodecInfo> made;
  const SLibDVideoCodecInfo& record = *made;
  expect_fields(record, {FIELD(name, kEmpty), FIELD(resolutions, kNoItems), FIELD(frameRates, kNoItems),
                         FIELD(qualities, kNoItems), FIELD(bitRates, kNoItems)});
}

TEST(Records, CommonPositionHasTheStatedFieldsAndDefaults) {
  const Made<SLibDCommonPosition> made;
  const SLibDCommonPosition& record = *made;
  expect_fields(record, {FIELD(x, kZero), FIELD(y, kZero)});
}

TEST(Records, ConnectionInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDConnectionInfo> made;
  const SLibDConnectionInfo& record = *made;
  expect_fields(record,
                {FIELD(streamTransport, kZero), FIELD(host, kEmpty), FIELD(port, kZero), FIELD(reserved4, kFalse),
                 FIELD(useProxy, kFalse), FIELD(proxyHost, kEmpty), FIELD(proxyPort, kZero), FIELD(timeout, kZero),
                 FIELD(userName, kEmpty), FIELD(password, kEmpty)});
}

TEST(Records, SystemInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDSystemInfo> made;
  const SLibDSystemInfo& record = *made;
  expect_fields(record, {FIELD(maker, kEmpty), FIELD(modelName, kEmpty), FIELD(softwareVersion, kEmpty),
                         FIELD(serialNumber, kEmpty), FIELD(macAddress, kEmpty)});
}

TEST(Records, FixedSystemInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDFixedSystemInfo> made;
  const SLibDFixedSystemInfo& record = *made;
  expect_fields(record, {FIELD(modelName, kUnknown), FIELD(reserved2, kUnknown), FIELD(reserved3, kUnknown),
                         FIELD(version, "\"1.0.0.0\""), FIELD(maker, "\"Vexa Corporation\""),
                         FIELD(capability1, "i32 -1"), FIELD(capability2, kZero), FIELD(capability3, kZero),
                         FIELD(capability4, kZero), FIELD(capability5, kZero), FIELD(capability6, kZero),
                         FIELD(flag1, kFalse), FIELD(flag2, kFalse), FIELD(flag3, kFalse), FIELD(flag4, kFalse)});
}

TEST(Records, FixedConnectionInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDFixedConnectionInfo> made;
  const SLibDFixedConnectionInfo& record = *made;
  expect_fields(record, {FIELD(flag1, kTrue), FIELD(flag2, kFalse), FIELD(flag3, kFalse), FIELD(flag4, kFalse),
                         FIELD(text, "\"0-0\"")});
}

TEST(Records, CameraInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDCameraInfo> made;
  const SLibDCameraInfo& record = *made;
  expect_fields(record,
                {FIELD(codecType, "i32 1"),      FIELD(codecName, kEmpty),        FIELD(streamNumber, "i32 1"),
                 FIELD(imageSizeText, kNone),    FIELD(imageWidth, kZero),        FIELD(imageHeight, kZero),
                 FIELD(reserved7, kZero),        FIELD(frameRateText, kNone),     FIELD(frameRate, kZero),
                 FIELD(qualityText, kNone),      FIELD(quality, kZero),           FIELD(bitRateText, kNone),
                 FIELD(bitRate, kZero),          FIELD(reserved14, kNone),        FIELD(reserved15, kZero),
                 FIELD(reserved16, kFalse),      FIELD(rotation, kZero),          FIELD(videoStandard, kZero),
                 FIELD(reserved19, "i32 7"),     FIELD(captureWidth, kZero),      FIELD(captureHeight, kZero),
                 FIELD(unicastVideoPort, kZero), FIELD(unicastVideoPort1, kZero), FIELD(unicastVideoPort2, kZero),
                 FIELD(rtspPort, kZero),         FIELD(solidPtz, kFalse),         FIELD(maxImageWidth, kZero),
                 FIELD(maxImageHeight, kZero)});
}

TEST(Records, FixedCameraInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDFixedCameraInfo> made;
  const SLibDFixedCameraInfo& record = *made;
  expect_fields(record, {FIELD(codecs, kNoItems), FIELD(reserved2, kNoItems), FIELD(electronicFlip, kZero),
                         FIELD(reserved4, kNoItems), FIELD(streamCount1, kZero), FIELD(streamCount2, kZero),
                         FIELD(flag1, kFalse), FIELD(flag2, kFalse), FIELD(flag3, kFalse), FIELD(flag4, kFalse),
                         FIELD(flag5, kFalse), FIELD(flag6, kFalse), FIELD(value1, kZero), FIELD(value2, kZero),
                         FIELD(value3, kZero), FIELD(value4, kZero), FIELD(value5, kZero)});
}

TEST(Records, VideoFrameInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDVideoFrameInfo> made;
  const SLibDVideoFrameInfo& record = *made;
  expect_fields(record,
                {FIELD(sink, kNull), FIELD(frameType, "i32 -1"), FIELD(seconds, kZero), FIELD(microseconds, kZero)});
}

TEST(Records, QueuedVideoFrameInfoHasTheStatedFieldsAndDefaults) {
  const Made<CVexaCommon::VideoFrameInfo> made;
  const CVexaCommon::VideoFrameInfo& record = *made;
  expect_fields(record, {FIELD(data, kNull), FIELD(capacity, kUnsignedZero), FIELD(length, kUnsignedZero),
                         FIELD(frameType, "i32 -1"), FIELD(seconds, kZero), FIELD(microseconds, kZero)});
}

TEST(Records, SPacketInfoHasTheStatedFieldsAndDefaults) {
  const Made<SPacketInfo> made;
  const SPacketInfo& record = *made;
  expect_fields(record, {FIELD(data, kNull), FIELD(received, kFalse), FIELD(marker, kFalse), FIELD(payloadType, "u8 0"),
                         FIELD(sequence, "u16 0"), FIELD(length, kUnsignedZero), FIELD(timestamp, kUnsignedZero),
                         FIELD(keyOnly, kFalse)});
}

TEST(Records, AudioInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDAudioInfo> made;
  const SLibDAudioInfo& record = *made;
  expect_fields(record, {FIELD(reserved1, kZero),    FIELD(codec, kNone),
                         FIELD(reserved3, kNone),    FIELD(bitRateLabel, kNone),
                         FIELD(bitRate, kZero),      FIELD(frameSizeLabel, kNone),
                         FIELD(frameSize, kZero),    FIELD(samplingRateLabel, kNone),
                         FIELD(samplingRate, kZero), FIELD(reserved10, kZero),
                         FIELD(label1, kNone),       FIELD(value1, kZero),
                         FIELD(label2, kNone),       FIELD(value2, kZero),
                         FIELD(label3, kNone),       FIELD(value3, kZero),
                         FIELD(label4, kNone),       FIELD(value4, kZero),
                         FIELD(label5, kNone),       FIELD(value5, kZero),
                         FIELD(reserved21, kZero)});
}

TEST(Records, AudioFrameInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDAudioFrameInfo> made;
  const SLibDAudioFrameInfo& record = *made;
  expect_fields(record, {FIELD(data, kNull), FIELD(capacity, kZero), FIELD(length, kZero), FIELD(codecType, kZero)});
}

TEST(Records, FixedAudioInfoHasTheStatedFieldsAndDefaults) {
  const Made<SLibDFixedAudioInfo> made;
  const SLibDFixedAudioInfo& record = *made;
  expect_fields(record, {FIELD(inputCodecs, kNoItems), FIELD(outputCodecs, kNoItems), FIELD(reserved3, kNoItems),
                         FIELD(reserved4, kNoItems), FIELD(available, kZero)});
}

TEST(Records, TextsOfCameraInfoHaveRoomFor256Characters) {
  const SLibDCameraInfo info;
  for (const std::string* text : {&info.codecName, &info.imageSizeText, &info.frameRateText, &info.qualityText,
                                  &info.bitRateText, &info.reserved14}) {
    EXPECT_GE(text->capacity(), 256U);
  }
}

TEST(Records, ALabelledNumberIsMadeFromItsLabelAndItsValue) {
  const SLibDCommonParameterInt rate("64 Kbps", 64000);
  EXPECT_EQ(rate.label, "64 Kbps");
  EXPECT_EQ(rate.value, 64000);
}

}  // namespace
