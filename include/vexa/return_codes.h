// SPDX-License-Identifier: Apache-2.0
// The results of a device's operations.
#pragma once

#include <cstdint>

/// Result of every operation of CLibraryDevice. Values below zero name the reason; of the streaming operations,
/// LIBD_NO_FRAME is no error.
enum ELibDReturnCode : std::int32_t {
  LIBD_OK = 1,                     ///< success
  LIBD_FAILED = 0,                 ///< any other failure; GetLatestErrorText returns the reason
  LIBD_NOT_SUPPORTED = -100,       ///< the driver does not offer the operation
  LIBD_INVALID_ARGUMENT = -101,    ///< an argument is out of its range; nothing was sent
  LIBD_INVALID_MODE = -102,        ///< not allowed in the camera's present mode; nothing was sent
  LIBD_STREAM_OPEN_FAILED = -103,  ///< the RTSP session could not be opened
  LIBD_TIMEOUT = -200,             ///< the camera did not answer in time, or a stream has been silent too long
  LIBD_UNAUTHORIZED = -201,        ///< the camera answered HTTP or RTSP status 401
  LIBD_NO_FRAME = -300,            ///< no new frame or data yet: ask again
  LIBD_FRAME_DAMAGED = -301,       ///< a picture could not be assembled
  LIBD_BUFFER_TOO_SMALL = -303     ///< a frame did not fit its buffer
};
