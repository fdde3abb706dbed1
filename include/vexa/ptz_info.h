// Pan, tilt, zoom and focus; presets, camera tours and shadow tours.
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

/// Pan and tilt of a camera, in its own units. Places without a meaning to the driver are copied through.
struct SLibDFixedPanTiltInfo {
  std::int32_t reserved1 = 0;
  std::int32_t panMaxSpeed = 0;  ///< camera speed units
  std::int32_t reserved3 = 0;
  std::int32_t reserved4 = 0;
  std::int32_t tiltMaxSpeed = 0;  ///< camera speed units
  std::int32_t reserved6 = 0;
  std::int32_t reserved7 = 0;
  std::int32_t horizontalWideAngle = 0;  ///< viewing angle at the wide end
  std::int32_t reserved9 = 0;
  std::int32_t reserved10 = 0;
  std::int32_t verticalWideAngle = 0;  ///< viewing angle at the wide end
  std::int32_t reserved12 = 0;
  std::int32_t reserved13 = 0;
  std::int32_t panSpan = 0;  ///< camera position units over the whole pan range
  std::int32_t reserved15 = 0;
  std::int32_t reserved16 = 0;
  std::int32_t panAngleRange = 0;  ///< angle of panSpan
  std::int32_t reserved18 = 0;
  std::int32_t panOrigin = 0;  ///< camera position of the left end
  std::int32_t reserved20 = 0;
  std::int32_t tiltSpan = 0;  ///< camera position units over the whole tilt range
  std::int32_t reserved22 = 0;
  std::int32_t reserved23 = 0;
  std::int32_t tiltAngleRange = 0;  ///< angle of tiltSpan
  std::int32_t reserved25 = 0;
  std::int32_t tiltOrigin = 0;  ///< camera position of the low end
  std::int32_t tiltOffset = 0;  ///< camera position of the horizon
};

/// Zoom of a camera, in its own units. Places without a meaning to the driver are copied through.
struct SLibDFixedZoomInfo {
  std::int32_t minSpeed = 0;  ///< camera speed units
  std::int32_t maxSpeed = 0;  ///< camera speed units
  std::int32_t reserved3 = 0;
  std::int32_t minPosition = 0;  ///< camera position units
  std::int32_t reserved5 = 0;
  std::int32_t reserved6 = 0;
  std::int32_t reserved7 = 0;
  std::int32_t maxPosition = 0;  ///< camera position units
  std::int32_t reserved9 = 0;
};

/// Focus of a camera, in its own units. Places without a meaning to the driver are copied through.
struct SLibDFixedFocusInfo {
  std::int32_t minSpeed = 0;  ///< camera speed units
  std::int32_t maxSpeed = 0;  ///< camera speed units
  std::int32_t reserved3 = 0;
  std::int32_t minPosition = 0;  ///< camera position units
  std::int32_t maxPosition = 0;  ///< camera position units
  std::int32_t reserved6 = 0;
};

/// What the camera's PTZ can do; filled by a model class.
struct SLibDFixedPTZControlInfo {
  std::vector<SLibDCommonParameterInt> reserved1;
  bool noMoveSpeed = false;  ///< the move dialect sends speed 0 for pan and tilt
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
  std::int32_t presetCount = 0;
  std::int32_t tourCount = 0;        ///< at most five have letters
  std::int32_t shadowTourCount = 0;  ///< at most five have letters
};

/// Where the camera looks, as its pictures say.
struct SLibDPTZStatus {
  std::int32_t panPosition = 0;   ///< thousandths of the unit of the pan angle range; as the camera's if it has no span
  std::int32_t tiltPosition = 0;  ///< the same for tilt
  std::int32_t horizontalAngle = 0;  ///< viewing angle, in the unit of the wide-end angle
  std::int32_t verticalAngle = 0;    ///< viewing angle, in the unit of the wide-end angle
  bool moving = false;               ///< set while the camera moves; never cleared by the driver
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
  std::int32_t stayTime = 10;  ///< seconds at each preset
  std::int32_t reserved4 = 0;  ///< 0 when read, never sent
  std::int32_t speed = 24;     ///< camera speed units
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
  std::int32_t recordedTime = 0;  ///< as the camera reports it; read only
};

/// All shadow tours.
struct SLibDShadowTourInfo {
  bool enabled = false;
  std::int32_t resumeTime = 0;                      ///< seconds; 0: no resuming
  std::int32_t maxRecordTime = 0;                   ///< as the camera reports it; read only
  std::map<int, SLibDShadowTourEachSetting> tours;  ///< by number, counted from 1
};

/// The letters of tours in requests, "A" to "E", for the tour numbers 1 to 5. Constant.
extern VEXA_API const char* const g_TourSelector[5];
