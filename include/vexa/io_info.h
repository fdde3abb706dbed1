// SPDX-License-Identifier: Apache-2.0
// Alarm pins, detection settings and motion metadata.
#pragma once

#include <cstdint>
#include <vector>

#include "vexa/common_types.h"
#include "vexa/export.h"

/// What a pin is (SLibDPinInfo::type). 3 is never produced.
enum ELibDPinType : std::int32_t {
  PIN_TYPE_SENSOR_INPUT = 0,    ///< an alarm (sensor) input
  PIN_TYPE_ALARM_OUTPUT = 1,    ///< an alarm output
  PIN_TYPE_DETECTION = 2,       ///< the video detection alarm (motion or object)
  PIN_TYPE_TAMPERING = 4,       ///< the tampering detector
  PIN_TYPE_AUDIO_DETECTION = 5  ///< the audio detector
};

/// Whether detection settings belong to presets or to the current view. Any value but LIBD_POSITION_PRESET is sent as
/// "current".
enum ELibDPositionMode : std::int32_t { LIBD_POSITION_PRESET = 0, LIBD_POSITION_CURRENT = 99 };

enum ELibDTamperLevel : std::int32_t { LIBD_TAMPER_LOW = 1, LIBD_TAMPER_MIDDLE = 2, LIBD_TAMPER_HIGH = 3 };

/// How the alarm-data stream reports detection: window items, or one "VMF" item.
enum ELibDVMDType : std::int32_t { LIBD_VMD_WINDOW = 0, LIBD_VMD_VMF = 1 };

/// One pin: the unit of all alarm I/O.
struct SLibDPinInfo {
  std::int32_t number = 0;                    ///< counted from 1, inputs and outputs each on their own
  std::int32_t type = PIN_TYPE_SENSOR_INPUT;  ///< an ELibDPinType value
  bool enabled = false;    ///< true for inputs and outputs; of a detector, whether the camera has it switched on
  std::int32_t state = 0;  ///< 0 inactive, 1 active (alarm present, or output on)
  std::int32_t reservedValue = 0;
  bool reservedFlag = false;
};

/// One detection window. Its area has room for 32 points from the start.
struct VEXA_API SLibDDetectionWindow {
  SLibDDetectionWindow();

  std::vector<SLibDCommonPosition> area;  ///< two corners of a rectangle, in the camera's coordinates
  std::int32_t enabled = -1;              ///< 1 on, 0 off
  std::int32_t mode = -1;                 ///< 0 detect, else mask
  std::int32_t minObjectWidth = 0;        ///< pixels; of LOD cameras the size class 0 small, 1 middle, 2 large
  std::int32_t minObjectHeight = 0;       ///< pixels
  std::int32_t maxObjectWidth = 0;        ///< pixels
  std::int32_t maxObjectHeight = 0;       ///< pixels
  std::int32_t sensitivity = -1;          ///< 1 to 100
};

/// One detection setting. Object sizes and sensitivity are those of the first window; the other windows' are not sent.
struct SLibDDetectionParam {
  std::int32_t number = -1;  ///< of the preset, from 1; 99: the current view
  std::int32_t reserved2 = -1;
  SLibDDetectionWindow windows[4];
};

/// The I/O settings of a camera.
struct SLibDIoBoxInfo {
  std::int32_t reserved1 = 0;
  std::vector<SLibDPinInfo> pins;
  std::int32_t reserved3 = 0;
  std::int32_t reserved4 = 0;
  std::int32_t reserved5 = 0;
  std::vector<SLibDDetectionParam> detections1;
  std::int32_t reserved7 = 0;
  std::int32_t reserved8 = 0;
  std::int32_t reserved9 = 0;
  std::int32_t reserved10 = 0;
  std::vector<SLibDDetectionParam> detections2;
  std::int32_t reserved12 = 0;
  std::int32_t tamperLevel = 0;  ///< 0 unknown, else an ELibDTamperLevel value
  std::int32_t vmdType = 0;      ///< an ELibDVMDType value
};

/// What a camera's I/O can do; filled by a model class. The driver copies all thirteen 32-bit words to the host.
struct SLibDFixedIoBoxInfo {
  std::int32_t inputCount = 0;
  std::int32_t outputCount = 0;
  bool flag8 = false;
  bool videoDetection = false;  ///< the camera reports a video detection alarm
  bool flag10 = false;
  bool flag11 = false;
  std::int32_t reserved3 = 0;
  std::int32_t reserved4 = 0;
  std::int32_t reserved5 = 0;
  bool flag24 = false;
  bool flag25 = false;
  bool flag26 = false;
  bool flag27 = false;
  std::int32_t reserved7 = 0;
  std::int32_t reserved8 = 0;
  std::int32_t reserved9 = 0;
  bool tamperingDetection = false;  ///< the camera has tampering detection
  bool audioDetection = false;      ///< the camera has audio detection
  bool flag42 = false;
  bool flag43 = false;
  std::int32_t reserved11 = 0;
  std::int32_t reserved12 = 0;
};
static_assert(sizeof(SLibDFixedIoBoxInfo) == 52, "hosts copy the record as thirteen 32-bit words");

/// One frame of motion metadata: a value a window. A value that the camera did not send is left as it was.
struct SLibDRawMDFrameInfo {
  std::int32_t window1 = 0;
  std::int32_t window2 = 0;
  std::int32_t window3 = 0;
  std::int32_t window4 = 0;
};
