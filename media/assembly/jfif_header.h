// The JPEG markers and tables in front of a picture's scan data, which do not travel over RTP.
#pragma once

#include <array>
#include <cstdint>

#include "media/assembly/frame_writer.h"
#include "runtime/base/bytes.h"

namespace vexa {

using QuantisationTable = std::array<unsigned char, 64>;

struct QuantisationTables {
  QuantisationTable luminance;
  QuantisationTable chrominance;
};

/// The tables of quality `q`, 0 to 127; 50 gives those of ITU-T T.81, tables K.1 and K.2.
QuantisationTables quantisation_tables(std::uint8_t q);

struct HuffmanTable {
  unsigned char destination;  ///< as DHT says it: the class (0 DC, 1 AC) in the high half, the number in the low
  std::array<unsigned char, 16> code_counts;
  Bytes symbols;
};

/// ITU-T T.81, tables K.3 to K.6: luminance DC and AC, chrominance DC and AC.
extern const std::array<HuffmanTable, 4> kHuffmanTables;

struct JpegShape {
  std::uint8_t width_in_8;         ///< units of 8 pixels
  std::uint8_t height_in_8;        ///< units of 8 pixels
  std::uint16_t restart_interval;  ///< 0: no DRI
};

/// Appends SOI, DQT, DRI, SOF0, DHT and SOS (ITU-T T.81). `fits` of the writer tells whether there was room.
void append_jfif_header(FrameWriter& out, const JpegShape& shape, const QuantisationTables& tables);

}  // namespace vexa
