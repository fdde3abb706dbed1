// New records: the fields and defaults that hosts know.
#include <gtest/gtest.h>

#include <cstddef>
#include <cstring>
#include <map>
#include <new>
#include <string>
#include <type_traits>
#include <vector>

#include "vexa/vexa.h"

namespace {

// How a value is written in the tables below; the kind shows too.
std::string show(bool value) { return value ? "true" : "false"; }
std::string show(const std::string& value) { return '"' + value + '"'; }
template <typename Number, typename = std::enable_if_t<std::is_integral_v<Number>>>
std::string show(Number value) {
  const std::string sign = std::is_signed_v<Number> ? "i" : "u";
  return sign + std::to_string(8 * sizeof value) + " " + std::to_string(value);
}
template <typename Target>
std::string show(Target* value) {
  return value == nullptr ? "null" : "set";
}
template <typename Item>
std::string show(const std::vector<Item>& value) {
  return "list of " + std::to_string(value.size());
}
template <typename Key, typename Item>
std::string show(const std::map<Key, Item>& value) {
  return "map of " + std::to_string(value.size());
}
std::string show(const SLibDFixedPanTiltInfo&) { return "block of 27"; }
std::string show(const SLibDFixedZoomInfo&) { return "block of 9"; }
std::string show(const SLibDFixedFocusInfo&) { return "block of 6"; }
std::string show(const SLibDDetectionWindow (&)[4]) { return "4 windows"; }

struct Field {
  const char* name;
  const void* address;
  std::size_t size;
  std::size_t alignment;
  std::string actual;
  std::string expected;
};

#define FIELD(name, expected) \
  Field { #name, &record.name, sizeof record.name, alignof(decltype(record.name)), show(record.name), expected }

/// A record made in memory that holds other bytes, so that a field nobody sets is seen.
template <typename Record>
class Made {
 public:
  Made() {
    std::memset(memory_, 0xA5, sizeof memory_);
    keep_bytes();
    record_ = new (memory_) Record;
    keep_bytes();
  }
  ~Made() { record_->~Record(); }
  Made(const Made&) = delete;
  Made& operator=(const Made&) = delete;

  const Record& operator*() const { return *record_; }

 private:
  // The compiler may not take the bytes for dead before the constructor, nor for unknown behind it.
  void keep_bytes() { asm volatile("" : : "r"(memory_) : "memory"); }

  alignas(Record) unsigned char memory_[sizeof(Record)];
  Record* record_ = nullptr;
};

std::size_t rounded_up(std::size_t offset, std::size_t alignment) {
  return (offset + alignment - 1) / alignment * alignment;
}

/// The fields are all the record has, stand in the order given and hold what the table says.
template <typename Record>
void expect_fields(const Record& record, const std::vector<Field>& fields) {
  const auto* begin = reinterpret_cast<const unsigned char*>(&record);
  std::size_t end = 0;
  for (const Field& field : fields) {
    EXPECT_EQ(field.actual, field.expected) << field.name;
    const auto offset = static_cast<std::size_t>(static_cast<const unsigned char*>(field.address) - begin);
    EXPECT_EQ(offset, rounded_up(end, field.alignment)) << field.name << " is not where the field before it ends";
    end = offset + field.size;
  }
  EXPECT_EQ(rounded_up(end, alignof(Record)), sizeof(Record)) << "fields behind the last one listed";
}

constexpr const char* kZero = "i32 0";
constexpr const char* kUnsignedZero = "u32 0";
constexpr const char* kFalse = "false";
constexpr const char* kTrue = "true";
constexpr const char* kEmpty = "\"\"";
constexpr const char* kNone = "\"none\"";
constexpr const char* kUnknown = "\"Unknown\"";
constexpr const char* kNull = "null";
constexpr const char* kNoItems = "list of 0";
constexpr const char* kNoEntries = "map of 0";

#define RECORD(name, type, ...)                        \
  TEST(Records, name##HasTheStatedFieldsAndDefaults) { \
    const Made<type> made;                             \
    const type& record = *made;                        \
    expect_fields(record, {__VA_ARGS__});              \
  }

RECORD(CommonParameterInt, SLibDCommonParameterInt, FIELD(label, kEmpty), FIELD(value, kZero))
RECORD(ZoomRatioInt, SLibDZoomRatioInt, FIELD(ratio, kZero), FIELD(position, kZero))
RECORD(DayNightModeInfo, SLibDDayNightModeInfo, FIELD(mode, kZero))
RECORD(BrightModeInfo, SLibDBrightModeInfo, FIELD(name, kEmpty), FIELD(shutterSpeeds, kNoItems),
       FIELD(irisPositions, kNoItems), FIELD(reserved4, kNoItems))
RECORD(AudioCodecInfo, SLibDAudioCodecInfo, FIELD(name, kEmpty), FIELD(bitRates, kNoItems), FIELD(frameSizes, kNoItems),
       FIELD(samplingRates, kNoItems))
RECORD(ResolutionInfo, SLibDResolutionInfo, FIELD(text, kEmpty), FIELD(width, kZero), FIELD(height, kZero))
RECORD(VideoCodecInfo, SLibDVideoCodecInfo, FIELD(name, kEmpty), FIELD(resolutions, kNoItems),
       FIELD(frameRates, kNoItems), FIELD(qualities, kNoItems), FIELD(bitRates, kNoItems))
RECORD(CommonPosition, SLibDCommonPosition, FIELD(x, kZero), FIELD(y, kZero))
RECORD(ConnectionInfo, SLibDConnectionInfo, FIELD(streamTransport, kZero), FIELD(host, kEmpty), FIELD(port, kZero),
       FIELD(reserved4, kFalse), FIELD(useProxy, kFalse), FIELD(proxyHost, kEmpty), FIELD(proxyPort, kZero),
       FIELD(timeout, kZero), FIELD(userName, kEmpty), FIELD(password, kEmpty))
RECORD(SystemInfo, SLibDSystemInfo, FIELD(maker, kEmpty), FIELD(modelName, kEmpty), FIELD(softwareVersion, kEmpty),
       FIELD(serialNumber, kEmpty), FIELD(macAddress, kEmpty))
RECORD(FixedSystemInfo, SLibDFixedSystemInfo, FIELD(modelName, kUnknown), FIELD(reserved2, kUnknown),
       FIELD(reserved3, kUnknown), FIELD(version, "\"1.0.0.0\""), FIELD(maker, "\"Vexa Corporation\""),
       FIELD(capability1, "i32 -1"), FIELD(capability2, kZero), FIELD(capability3, kZero), FIELD(capability4, kZero),
       FIELD(capability5, kZero), FIELD(capability6, kZero), FIELD(flag1, kFalse), FIELD(flag2, kFalse),
       FIELD(flag3, kFalse), FIELD(flag4, kFalse))
RECORD(FixedConnectionInfo, SLibDFixedConnectionInfo, FIELD(flag1, kTrue), FIELD(flag2, kFalse), FIELD(flag3, kFalse),
       FIELD(flag4, kFalse), FIELD(text, "\"0-0\""))
RECORD(CameraInfo, SLibDCameraInfo, FIELD(codecType, "i32 1"), FIELD(codecName, kEmpty), FIELD(streamNumber, "i32 1"),
       FIELD(imageSizeText, kNone), FIELD(imageWidth, kZero), FIELD(imageHeight, kZero), FIELD(reserved7, kZero),
       FIELD(frameRateText, kNone), FIELD(frameRate, kZero), FIELD(qualityText, kNone), FIELD(quality, kZero),
       FIELD(bitRateText, kNone), FIELD(bitRate, kZero), FIELD(reserved14, kNone), FIELD(reserved15, kZero),
       FIELD(reserved16, kFalse), FIELD(rotation, kZero), FIELD(videoStandard, kZero), FIELD(reserved19, "i32 7"),
       FIELD(captureWidth, kZero), FIELD(captureHeight, kZero), FIELD(unicastVideoPort, kZero),
       FIELD(unicastVideoPort1, kZero), FIELD(unicastVideoPort2, kZero), FIELD(rtspPort, kZero),
       FIELD(solidPtz, kFalse), FIELD(maxImageWidth, kZero), FIELD(maxImageHeight, kZero))
RECORD(FixedCameraInfo, SLibDFixedCameraInfo, FIELD(codecs, kNoItems), FIELD(reserved2, kNoItems),
       FIELD(electronicFlip, kZero), FIELD(reserved4, kNoItems), FIELD(streamCount1, kZero), FIELD(streamCount2, kZero),
       FIELD(flag1, kFalse), FIELD(flag2, kFalse), FIELD(flag3, kFalse), FIELD(flag4, kFalse), FIELD(flag5, kFalse),
       FIELD(flag6, kFalse), FIELD(value1, kZero), FIELD(value2, kZero), FIELD(value3, kZero), FIELD(value4, kZero),
       FIELD(value5, kZero))
RECORD(VideoFrameInfo, SLibDVideoFrameInfo, FIELD(sink, kNull), FIELD(frameType, "i32 -1"), FIELD(seconds, kZero),
       FIELD(microseconds, kZero))
RECORD(QueuedVideoFrameInfo, CVexaCommon::VideoFrameInfo, FIELD(data, kNull), FIELD(capacity, kUnsignedZero),
       FIELD(length, kUnsignedZero), FIELD(frameType, "i32 -1"), FIELD(seconds, kZero), FIELD(microseconds, kZero))
RECORD(SPacketInfo, SPacketInfo, FIELD(data, kNull), FIELD(received, kFalse), FIELD(marker, kFalse),
       FIELD(payloadType, "u8 0"), FIELD(sequence, "u16 0"), FIELD(length, kUnsignedZero),
       FIELD(timestamp, kUnsignedZero), FIELD(keyOnly, kFalse))
RECORD(AudioInfo, SLibDAudioInfo, FIELD(reserved1, kZero), FIELD(codec, kNone), FIELD(reserved3, kNone),
       FIELD(bitRateLabel, kNone), FIELD(bitRate, kZero), FIELD(frameSizeLabel, kNone), FIELD(frameSize, kZero),
       FIELD(samplingRateLabel, kNone), FIELD(samplingRate, kZero), FIELD(reserved10, kZero), FIELD(label1, kNone),
       FIELD(value1, kZero), FIELD(label2, kNone), FIELD(value2, kZero), FIELD(label3, kNone), FIELD(value3, kZero),
       FIELD(label4, kNone), FIELD(value4, kZero), FIELD(label5, kNone), FIELD(value5, kZero), FIELD(reserved21, kZero))
RECORD(AudioFrameInfo, SLibDAudioFrameInfo, FIELD(data, kNull), FIELD(capacity, kZero), FIELD(length, kZero),
       FIELD(codecType, kZero))
RECORD(FixedAudioInfo, SLibDFixedAudioInfo, FIELD(inputCodecs, kNoItems), FIELD(outputCodecs, kNoItems),
       FIELD(reserved3, kNoItems), FIELD(reserved4, kNoItems), FIELD(available, kZero))
RECORD(FixedPTZControlInfo, SLibDFixedPTZControlInfo, FIELD(reserved1, kNoItems), FIELD(noMoveSpeed, kFalse),
       FIELD(reserved3, kFalse), FIELD(panTilt, "block of 27"), FIELD(reserved5, kZero), FIELD(zoom, "block of 9"),
       FIELD(zoomSteps, kNoItems), FIELD(reserved8, kZero), FIELD(focus, "block of 6"), FIELD(reserved10, kZero),
       FIELD(brightModes, kNoItems), FIELD(reserved12, kFalse), FIELD(reserved13, kFalse),
       FIELD(dayNightModes, kNoItems), FIELD(presetCount, kZero), FIELD(tourCount, kZero),
       FIELD(shadowTourCount, kZero))
RECORD(FixedPanTiltInfo, SLibDFixedPanTiltInfo, FIELD(reserved1, kZero), FIELD(panMaxSpeed, kZero),
       FIELD(reserved3, kZero), FIELD(reserved4, kZero), FIELD(tiltMaxSpeed, kZero), FIELD(reserved6, kZero),
       FIELD(reserved7, kZero), FIELD(horizontalWideAngle, kZero), FIELD(reserved9, kZero), FIELD(reserved10, kZero),
       FIELD(verticalWideAngle, kZero), FIELD(reserved12, kZero), FIELD(reserved13, kZero), FIELD(panSpan, kZero),
       FIELD(reserved15, kZero), FIELD(reserved16, kZero), FIELD(panAngleRange, kZero), FIELD(reserved18, kZero),
       FIELD(panOrigin, kZero), FIELD(reserved20, kZero), FIELD(tiltSpan, kZero), FIELD(reserved22, kZero),
       FIELD(reserved23, kZero), FIELD(tiltAngleRange, kZero), FIELD(reserved25, kZero), FIELD(tiltOrigin, kZero),
       FIELD(tiltOffset, kZero))
RECORD(FixedZoomInfo, SLibDFixedZoomInfo, FIELD(minSpeed, kZero), FIELD(maxSpeed, kZero), FIELD(reserved3, kZero),
       FIELD(minPosition, kZero), FIELD(reserved5, kZero), FIELD(reserved6, kZero), FIELD(reserved7, kZero),
       FIELD(maxPosition, kZero), FIELD(reserved9, kZero))
RECORD(FixedFocusInfo, SLibDFixedFocusInfo, FIELD(minSpeed, kZero), FIELD(maxSpeed, kZero), FIELD(reserved3, kZero),
       FIELD(minPosition, kZero), FIELD(maxPosition, kZero), FIELD(reserved6, kZero))
RECORD(PTZStatus, SLibDPTZStatus, FIELD(panPosition, kZero), FIELD(tiltPosition, kZero), FIELD(horizontalAngle, kZero),
       FIELD(verticalAngle, kZero), FIELD(moving, kFalse))
RECORD(PTZControlInfo, SLibDPTZControlInfo, FIELD(reserved1, kZero), FIELD(reserved2, kEmpty), FIELD(reserved3, kZero),
       FIELD(reserved4, kFalse), FIELD(reserved5, kFalse), FIELD(brightMode, kEmpty), FIELD(reserved7, kZero),
       FIELD(reserved8, kEmpty), FIELD(reserved9, kZero), FIELD(reserved10, kEmpty), FIELD(reserved11, kZero),
       FIELD(reserved12, kEmpty), FIELD(reserved13, kZero))
RECORD(PresetInfo, SLibDPresetInfo, FIELD(index, kZero), FIELD(name, kEmpty))
RECORD(CameraTourInfo, SLibDCameraTourInfo, FIELD(enabled, kFalse), FIELD(resumeTime, kZero), FIELD(tours, kNoEntries))
RECORD(CameraTourEachSetting, SLibDCameraTourEachSetting, FIELD(enabled, kFalse), FIELD(sequence, kNoItems),
       FIELD(stayTime, "i32 10"), FIELD(reserved4, kZero), FIELD(speed, "i32 24"))
RECORD(ShadowTourInfo, SLibDShadowTourInfo, FIELD(enabled, kFalse), FIELD(resumeTime, kZero),
       FIELD(maxRecordTime, kZero), FIELD(tours, kNoEntries))
RECORD(ShadowTourEachSetting, SLibDShadowTourEachSetting, FIELD(enabled, kFalse), FIELD(reserved2, kZero),
       FIELD(recordedTime, kZero))
RECORD(PinInfo, SLibDPinInfo, FIELD(number, kZero), FIELD(type, kZero), FIELD(enabled, kFalse), FIELD(state, kZero),
       FIELD(reservedValue, kZero), FIELD(reservedFlag, kFalse))
RECORD(IoBoxInfo, SLibDIoBoxInfo, FIELD(reserved1, kZero), FIELD(pins, kNoItems), FIELD(reserved3, kZero),
       FIELD(reserved4, kZero), FIELD(reserved5, kZero), FIELD(detections1, kNoItems), FIELD(reserved7, kZero),
       FIELD(reserved8, kZero), FIELD(reserved9, kZero), FIELD(reserved10, kZero), FIELD(detections2, kNoItems),
       FIELD(reserved12, kZero), FIELD(tamperLevel, kZero), FIELD(vmdType, kZero))
RECORD(FixedIoBoxInfo, SLibDFixedIoBoxInfo, FIELD(inputCount, kZero), FIELD(outputCount, kZero), FIELD(flag8, kFalse),
       FIELD(videoDetection, kFalse), FIELD(flag10, kFalse), FIELD(flag11, kFalse), FIELD(reserved3, kZero),
       FIELD(reserved4, kZero), FIELD(reserved5, kZero), FIELD(flag24, kFalse), FIELD(flag25, kFalse),
       FIELD(flag26, kFalse), FIELD(flag27, kFalse), FIELD(reserved7, kZero), FIELD(reserved8, kZero),
       FIELD(reserved9, kZero), FIELD(tamperingDetection, kFalse), FIELD(audioDetection, kFalse), FIELD(flag42, kFalse),
       FIELD(flag43, kFalse), FIELD(reserved11, kZero), FIELD(reserved12, kZero))
RECORD(DetectionParam, SLibDDetectionParam, FIELD(number, "i32 -1"), FIELD(reserved2, "i32 -1"),
       FIELD(windows, "4 windows"))
RECORD(DetectionWindow, SLibDDetectionWindow, FIELD(area, kNoItems), FIELD(enabled, "i32 -1"), FIELD(mode, "i32 -1"),
       FIELD(minObjectWidth, kZero), FIELD(minObjectHeight, kZero), FIELD(maxObjectWidth, kZero),
       FIELD(maxObjectHeight, kZero), FIELD(sensitivity, "i32 -1"))
RECORD(RawMDFrameInfo, SLibDRawMDFrameInfo, FIELD(window1, kZero), FIELD(window2, kZero), FIELD(window3, kZero),
       FIELD(window4, kZero))
RECORD(EdgeStorageMode, SLibDEdgeStorageMode, FIELD(enabled, kFalse), FIELD(imageNumber, kZero),
       FIELD(alarmTime1, kZero), FIELD(alarmTime2, kZero), FIELD(watchAddress, kEmpty))
RECORD(EdgeStorageRecord, SLibDEdgeStorageRecord, FIELD(streamName, kEmpty), FIELD(start, "i64 0"), FIELD(end, "i64 0"),
       FIELD(imageCodec, kEmpty), FIELD(imageSize, kEmpty), FIELD(frameRate, kZero), FIELD(bitRate, kZero),
       FIELD(quality, kZero), FIELD(audioCodec, kEmpty), FIELD(size, kZero), FIELD(status, kEmpty))
RECORD(EdgeStorageRecordList, SLibDEdgeStorageRecordList, FIELD(records, kNoItems))
RECORD(EdgeStorageStreamingInfo, SLibDEdgeStorageStreamingInfo, FIELD(streamName, kEmpty), FIELD(codecName, kEmpty),
       FIELD(scale, "i32 1"))

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
