// SPDX-License-Identifier: Apache-2.0
// Recordings held on the camera's own card.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

/// How a camera records on its card.
struct SLibDEdgeStorageMode {
  bool enabled = false;
  std::int32_t imageNumber = 0;  ///< the video stream that is recorded, from 1
  std::int32_t alarmTime1 = 0;   ///< seconds recorded from before the alarm; sent as 0 unless imageNumber is 1
  std::int32_t alarmTime2 = 0;   ///< seconds recorded after the alarm
  std::string watchAddress;      ///< recording starts when the camera no longer reaches this address
};

/// One recording.
struct SLibDEdgeStorageRecord {
  std::string streamName;
  std::int64_t start = 0;  ///< seconds since 1970-01-01 UTC
  std::int64_t end = 0;    ///< seconds since 1970-01-01 UTC
  std::string imageCodec;
  std::string imageSize;       ///< "width,height"
  std::int32_t frameRate = 0;  ///< frames per second
  std::int32_t bitRate = 0;    ///< kbit/s; 0 for a recording with a quality
  std::int32_t quality = 0;    ///< JPEG quality level
  std::string audioCodec;
  std::int32_t size = 0;  ///< as the camera reports it, with no unit given
  std::string status;
};

struct SLibDEdgeStorageRecordList {
  std::vector<SLibDEdgeStorageRecord> records;
};

/// What to play back, or to delete.
struct SLibDEdgeStorageStreamingInfo {
  std::string streamName;
  std::string codecName;   ///< "JPEG", "MPEG4" or "H.264"
  std::int32_t scale = 1;  ///< pace, as RTSP's Scale (RFC 2326, 12.34); below 0: backwards
};
