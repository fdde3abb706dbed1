// SPDX-License-Identifier: Apache-2.0
// Pan, tilt, zoom and focus; presets, camera tours and shadow tours.
//
// Three kinds of units meet here. The host's are fixed: speeds -10000 to 10000, positions 0 to 10000. The camera's are
// steps of its motors, different for each model: the SLibDFixed... records translate between both. Angles are degrees.
//
// Signs: pan grows to the right and tilt upwards, in the host's units and, for a camera that stands upright, in the
// camera's. Zoom grows towards tele, focus towards near.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "vexa/common_types.h"
#include "vexa/export.h"

/// Directions of motion, in the order of the camera's words.
enum ELibDPanTiltDirection : std::int32_t {
  LIBD_DIRECTION_UP_LEFT = 0,
  LIBD_DIRECTION_UP = 1,
  LIBD_DIRECTION_UP_RIGHT = 2,
  LIBD_DIRECTION_LEFT = 3,
  LIBD_DIRECTION_STOP = 4,
  LIBD_DIRECTION_RIGHT = 5,
  LIBD_DIRECTION_DOWN_LEFT = 6,
  LIBD_DIRECTION_DOWN = 7,
  LIBD_DIRECTION_DOWN_RIGHT = 8
};

/// Pan and tilt of a camera. Places without a meaning to the driver are copied through.
///
/// The host's position p, 0 to 10000, is the camera's position origin + p * span / 20000: *half* of the span is the way
/// from one end to the other, so panSpan and panAngleRange describe twice the model's travel. A camera that turns full
/// circle in 160 steps a degree, from -28800 to 28800, has panSpan 115200, panAngleRange 720 and panOrigin -28800.
struct SLibDFixedPanTiltInfo {
  std::int32_t reserved1 = 0;
  std::int32_t panMaxSpeed = 0;  ///< the camera's speed for the host's 10000; above 0
  std::int32_t reserved3 = 0;
  std::int32_t reserved4 = 0;
  std::int32_t tiltMaxSpeed = 0;  ///< the camera's speed for the host's 10000; above 0
  std::int32_t reserved6 = 0;
  std::int32_t reserved7 = 0;
  std::int32_t horizontalWideAngle = 0;  ///< degrees that the picture spans at the wide end; 0: not known
  std::int32_t reserved9 = 0;
  std::int32_t reserved10 = 0;
  std::int32_t verticalWideAngle = 0;  ///< degrees that the picture spans at the wide end; 0: not known
  std::int32_t reserved12 = 0;
  std::int32_t reserved13 = 0;
  std::int32_t panSpan = 0;  ///< camera steps in panAngleRange degrees; 0: not known
  std::int32_t reserved15 = 0;
  std::int32_t reserved16 = 0;
  std::int32_t panAngleRange = 0;  ///< degrees, twice the model's travel
  std::int32_t reserved18 = 0;
  std::int32_t panOrigin = 0;  ///< camera position of the left end, in steps; -32768 to 32767
  std::int32_t reserved20 = 0;
  std::int32_t tiltSpan = 0;  ///< camera steps in tiltAngleRange degrees; 0: not known
  std::int32_t reserved22 = 0;
  std::int32_t reserved23 = 0;
  std::int32_t tiltAngleRange = 0;  ///< degrees, twice the model's travel
  std::int32_t reserved25 = 0;
  std::int32_t tiltOrigin = 0;  ///< camera position of the low end, in steps; -32768 to 32767
  std::int32_t tiltOffset = 0;  ///< camera position of the horizon, in steps
};

/// Zoom of a camera, in steps of its lens: from minPosition (wide end) to maxPosition (tele end). Speeds are the
/// camera's for the host's smallest and greatest. Places without a meaning to the driver are copied through.
struct SLibDFixedZoomInfo {
  std::int32_t minSpeed = 0;  ///< the camera's slowest
  std::int32_t maxSpeed = 0;  ///< the camera's fastest
  std::int32_t reserved3 = 0;
  std::int32_t minPosition = 0;  ///< wide end
  std::int32_t reserved5 = 0;
  std::int32_t reserved6 = 0;
  std::int32_t reserved7 = 0;
  std::int32_t maxPosition = 0;  ///< tele end
  std::int32_t reserved9 = 0;
};

/// Focus of a camera, in steps of its lens. Speeds are the camera's for the host's smallest and greatest; the host's
/// positions 0 and 10000 are minPosition and maxPosition. Places without a meaning to the driver are copied through.
struct SLibDFixedFocusInfo {
  std::int32_t minSpeed = 0;  ///< the camera's slowest
  std::int32_t maxSpeed = 0;  ///< the camera's fastest
  std::int32_t reserved3 = 0;
  std::int32_t minPosition = 0;  ///< where the host's 0 is
  std::int32_t maxPosition = 0;  ///< where the host's 10000 is
  std::int32_t reserved6 = 0;
};

/// What the camera's PTZ can do; filled by a model class.
struct SLibDFixedPTZControlInfo {
  std::vector<SLibDCommonParameterInt> reserved1;
  bool noMoveSpeed = false;  ///< pan and tilt are sent with speed 0, which leaves the pace to the camera
  bool reserved3 = false;
  SLibDFixedPanTiltInfo panTilt;
  std::int32_t reserved5 = 0;
  SLibDFixedZoomInfo zoom;
  std::vector<SLibDZoomRatioInt> zoomSteps;
  std::int32_t reserved8 = 0;
  SLibDFixedFocusInfo focus;
  std::int32_t reserved10 = 0;
  std::vector<SLibDBrightModeInfo> brightModes;  ///< exposure modes with their steps
  bool reserved12 = false;
  bool reserved13 = false;
  std::vector<SLibDDayNightModeInfo> dayNightModes;
  std::int32_t presetCount = 0;      ///< 0: the camera has no presets
  std::int32_t tourCount = 0;        ///< tours beyond the fifth cannot be named in requests
  std::int32_t shadowTourCount = 0;  ///< likewise
};

/// Where the camera looks, as its latest picture reports it. With the picture upside down (SLibDCameraInfo::rotation
/// 180) pan and tilt change their signs, as right and up do in the picture.
struct SLibDPTZStatus {
  std::int32_t panPosition = 0;      ///< thousandths of a degree from the camera's position 0; steps while panSpan is 0
  std::int32_t tiltPosition = 0;     ///< thousandths of a degree above the horizon; steps while tiltSpan is 0
  std::int32_t horizontalAngle = 0;  ///< what the picture spans, in ten-thousandths of a degree
  std::int32_t verticalAngle = 0;    ///< the same vertically
  bool moving = false;               ///< set by the driver while the camera moves; the host clears it
};

/// Control settings that the driver stores and hands back; it reads the exposure mode.
struct SLibDPTZControlInfo {
  std::int32_t reserved1 = 0;
  std::string reserved2;
  std::int32_t reserved3 = 0;
  bool reserved4 = false;
  bool reserved5 = false;
  std::string brightMode;  ///< "Full auto", "Shutter Priority" or "Iris Priority"
  std::int32_t reserved7 = 0;
  std::string reserved8;
  std::int32_t reserved9 = 0;
  std::string reserved10;
  std::int32_t reserved11 = 0;
  std::string reserved12;
  std::int32_t reserved13 = 0;
};

/// A stored position of the camera.
struct SLibDPresetInfo {
  std::int32_t index = 0;  ///< counted from 0 by the host (the camera counts from 1)
  std::string name;        ///< as the camera sends it, not decoded
};

/// One camera tour: presets visited in turn.
struct SLibDCameraTourEachSetting {
  bool enabled = false;
  std::vector<int> sequence;   ///< camera preset numbers, counted from 1
  std::int32_t stayTime = 10;  ///< seconds at each preset; not checked
  std::int32_t reserved4 = 0;  ///< 0 when read, never sent
  std::int32_t speed = 24;     ///< of the moves between presets, in the camera's unit; not checked
};

/// All camera tours.
struct SLibDCameraTourInfo {
  bool enabled = false;
  std::int32_t resumeTime = 0;                      ///< seconds after manual operation; 0: no resuming
  std::map<int, SLibDCameraTourEachSetting> tours;  ///< by tour number, counted from 1
};

/// One shadow tour: a movement that the camera recorded.
struct SLibDShadowTourEachSetting {
  bool enabled = false;
  std::int32_t reserved2 = 0;     ///< 0 when read, never sent
  std::int32_t recordedTime = 0;  ///< as the camera reports it, with no unit given; read only
};

/// All shadow tours.
struct SLibDShadowTourInfo {
  bool enabled = false;
  std::int32_t resumeTime = 0;                      ///< seconds; 0: no resuming
  std::int32_t maxRecordTime = 0;                   ///< as the camera reports it, with no unit given; read only
  std::map<int, SLibDShadowTourEachSetting> tours;  ///< by number, counted from 1
};

/// The letters of tours in requests, "A" to "E", for the tour numbers 1 to 5. Constant.
extern VEXA_API const char* const g_TourSelector[5];
