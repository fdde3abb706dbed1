// SPDX-License-Identifier: Apache-2.0
// Words of exposure and image control.
#pragma once

#include <cstdint>

enum ELibDDayNightType : std::int32_t {
  LIBD_DAYNIGHT_UNKNOWN = -1,  ///< read only
  LIBD_DAYNIGHT_AUTO = 10,
  LIBD_DAYNIGHT_DAY = 20,
  LIBD_DAYNIGHT_NIGHT = 30
};

/// Noise reduction.
enum ELibDXdnrType : std::int32_t { LIBD_XDNR_HIGH = 0, LIBD_XDNR_MIDDLE = 1, LIBD_XDNR_LOW = 2, LIBD_XDNR_OFF = 3 };

enum ELibDVisibilityEnhancerType : std::int32_t {
  LIBD_VISIBILITY_HIGH = 0,
  LIBD_VISIBILITY_MIDDLE = 1,
  LIBD_VISIBILITY_LOW = 2,
  LIBD_VISIBILITY_OFF = 3
};

/// Wide dynamic range.
enum ELibDViewDRMode : std::int32_t { LIBD_VIEWDR_OFF = 0, LIBD_VIEWDR_ON = 1 };

/// Infrared illuminator: off, or following the day/night mode.
enum ELibIRIlluminatorMode : std::int32_t { LIB_IR_OFF = 0, LIB_IR_DAYNIGHT = 1 };
