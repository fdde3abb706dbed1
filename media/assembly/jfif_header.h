// The JPEG markers in front of a picture's scan data, which do not travel over RTP.
#pragma once

#include <cstdint>

#include "media/assembly/frame_writer.h"
#include "media/assembly/jpeg_tables.h"

namespace vexa {

struct JpegShape {
  std::uint8_t width_in_8;         ///< units of 8 pixels
  std::uint8_t height_in_8;        ///< units of 8 pixels
  std::uint16_t restart_interval;  ///< 0: no DRI
};

/// Appends SOI, DQT, DRI, SOF0, DHT and SOS (ITU-T T.81). `fits` of the writer is false when there was no room.
void append_jfif_header(FrameWriter& out, const JpegShape& shape, const QuantisationTables& tables);

}  // namespace vexa
