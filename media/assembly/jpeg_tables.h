// The tables that JPEG pictures over RTP leave out: quantisation by quality, and the standard Huffman tables.
#pragma once

#include <array>
#include <cstdint>

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
  unsigned char destination;  ///< as in DHT: the class (0 DC, 1 AC) in the high half, the number in the low
  std::array<unsigned char, 16> code_counts;
  Bytes symbols;
};

/// ITU-T T.81, tables K.3 to K.6: luminance DC and AC, chrominance DC and AC.
extern const std::array<HuffmanTable, 4> kHuffmanTables;

}  // namespace vexa
