// SPDX-License-Identifier: Apache-2.0
#include "media/assembly/jfif_header.h"

#include <algorithm>
#include <cstddef>

namespace vexa {
namespace {

constexpr unsigned char kStartOfImage[] = {0xff, 0xd8};
/// What a DHT segment's length counts besides its symbols: itself, the destination and the counts.
constexpr std::size_t kHuffmanSegmentRest = 19;

constexpr unsigned char high_byte(std::size_t value) { return static_cast<unsigned char>(value >> 8); }
constexpr unsigned char low_byte(std::size_t value) { return static_cast<unsigned char>(value); }

void append_quantisation(FrameWriter& out, unsigned char number, const QuantisationTable& table) {
  const unsigned char head[] = {0xff, 0xdb, 0, 0x43, number};
  out.append(head);
  out.append(table);
}

void append_restart_interval(FrameWriter& out, std::uint16_t interval) {
  if (interval == 0) return;
  const unsigned char segment[] = {0xff, 0xdd, 0, 4, high_byte(interval), low_byte(interval)};
  out.append(segment);
}

// Kept: whatever sampling the RTP type names, it is 4:2:0; these cameras send no other.
void append_frame(FrameWriter& out, const JpegShape& shape) {
  const std::size_t width = std::size_t{shape.width_in_8} * 8;
  const std::size_t height = std::size_t{shape.height_in_8} * 8;
  const unsigned char segment[] = {
      0xff, 0xc0, 0, 0x11, 8, high_byte(height), low_byte(height), high_byte(width), low_byte(width), 3, 0, 0x22, 0, 1,
      0x11, 1,    2, 0x11, 1};
  out.append(segment);
}

void append_huffman(FrameWriter& out, const HuffmanTable& table) {
  const std::size_t length = table.symbols.size() + kHuffmanSegmentRest;
  const unsigned char head[] = {0xff, 0xc4, high_byte(length), low_byte(length), table.destination};
  out.append(head);
  out.append(table.code_counts);
  out.append(table.symbols);
}

void append_scan(FrameWriter& out) {
  constexpr unsigned char kSegment[] = {0xff, 0xda, 0, 0x0c, 3, 0, 0, 1, 0x11, 2, 0x11, 0, 0x3f, 0};
  out.append(kSegment);
}

// Kept: rows one after the other, also in DQT, where other senders and receivers order by zig-zag; these cameras scale
// with the tables in this order.
constexpr QuantisationTable kLuminance = {16, 11, 10, 16, 24,  40,  51,  61,   //
                                          12, 12, 14, 19, 26,  58,  60,  55,   //
                                          14, 13, 16, 24, 40,  57,  69,  56,   //
                                          14, 17, 22, 29, 51,  87,  80,  62,   //
                                          18, 22, 37, 56, 68,  109, 103, 77,   //
                                          24, 35, 55, 64, 81,  104, 113, 92,   //
                                          49, 64, 78, 87, 103, 121, 120, 101,  //
                                          72, 92, 95, 98, 112, 100, 103, 99};

constexpr QuantisationTable kChrominance = {17, 18, 24, 47, 99, 99, 99, 99,  //
                                            18, 21, 26, 66, 99, 99, 99, 99,  //
                                            24, 26, 56, 99, 99, 99, 99, 99,  //
                                            47, 66, 99, 99, 99, 99, 99, 99,  //
                                            99, 99, 99, 99, 99, 99, 99, 99,  //
                                            99, 99, 99, 99, 99, 99, 99, 99,  //
                                            99, 99, 99, 99, 99, 99, 99, 99,  //
                                            99, 99, 99, 99, 99, 99, 99, 99};

constexpr unsigned char kDcSymbols[] = {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11};

constexpr unsigned char kLuminanceAcSymbols[] = {
    0x01, 0x02, 0x03, 0x00, 0x04, 0x11, 0x05, 0x12, 0x21, 0x31, 0x41, 0x06, 0x13, 0x51, 0x61, 0x07, 0x22, 0x71,
    0x14, 0x32, 0x81, 0x91, 0xa1, 0x08, 0x23, 0x42, 0xb1, 0xc1, 0x15, 0x52, 0xd1, 0xf0, 0x24, 0x33, 0x62, 0x72,
    0x82, 0x09, 0x0a, 0x16, 0x17, 0x18, 0x19, 0x1a, 0x25, 0x26, 0x27, 0x28, 0x29, 0x2a, 0x34, 0x35, 0x36, 0x37,
    0x38, 0x39, 0x3a, 0x43, 0x44, 0x45, 0x46, 0x47, 0x48, 0x49, 0x4a, 0x53, 0x54, 0x55, 0x56, 0x57, 0x58, 0x59,
    0x5a, 0x63, 0x64, 0x65, 0x66, 0x67, 0x68, 0x69, 0x6a, 0x73, 0x74, 0x75, 0x76, 0x77, 0x78, 0x79, 0x7a, 0x83,
    0x84, 0x85, 0x86, 0x87, 0x88, 0x89, 0x8a, 0x92, 0x93, 0x94, 0x95, 0x96, 0x97, 0x98, 0x99, 0x9a, 0xa2, 0xa3,
    0xa4, 0xa5, 0xa6, 0xa7, 0xa8, 0xa9, 0xaa, 0xb2, 0xb3, 0xb4, 0xb5, 0xb6, 0xb7, 0xb8, 0xb9, 0xba, 0xc2, 0xc3,
    0xc4, 0xc5, 0xc6, 0xc7, 0xc8, 0xc9, 0xca, 0xd2, 0xd3, 0xd4, 0xd5, 0xd6, 0xd7, 0xd8, 0xd9, 0xda, 0xe1, 0xe2,
    0xe3, 0xe4, 0xe5, 0xe6, 0xe7, 0xe8, 0xe9, 0xea, 0xf1, 0xf2, 0xf3, 0xf4, 0xf5, 0xf6, 0xf7, 0xf8, 0xf9, 0xfa};

constexpr unsigned char kChrominanceAcSymbols[] = {
    0x00, 0x01, 0x02, 0x03, 0x11, 0x04, 0x05, 0x21, 0x31, 0x06, 0x12, 0x41, 0x51, 0x07, 0x61, 0x71, 0x13, 0x22,
    0x32, 0x81, 0x08, 0x14, 0x42, 0x91, 0xa1, 0xb1, 0xc1, 0x09, 0x23, 0x33, 0x52, 0xf0, 0x15, 0x62, 0x72, 0xd1,
    0x0a, 0x16, 0x24, 0x34, 0xe1, 0x25, 0xf1, 0x17, 0x18, 0x19, 0x1a, 0x26, 0x27, 0x28, 0x29, 0x2a, 0x35, 0x36,
    0x37, 0x38, 0x39, 0x3a, 0x43, 0x44, 0x45, 0x46, 0x47, 0x48, 0x49, 0x4a, 0x53, 0x54, 0x55, 0x56, 0x57, 0x58,
    0x59, 0x5a, 0x63, 0x64, 0x65, 0x66, 0x67, 0x68, 0x69, 0x6a, 0x73, 0x74, 0x75, 0x76, 0x77, 0x78, 0x79, 0x7a,
    0x82, 0x83, 0x84, 0x85, 0x86, 0x87, 0x88, 0x89, 0x8a, 0x92, 0x93, 0x94, 0x95, 0x96, 0x97, 0x98, 0x99, 0x9a,
    0xa2, 0xa3, 0xa4, 0xa5, 0xa6, 0xa7, 0xa8, 0xa9, 0xaa, 0xb2, 0xb3, 0xb4, 0xb5, 0xb6, 0xb7, 0xb8, 0xb9, 0xba,
    0xc2, 0xc3, 0xc4, 0xc5, 0xc6, 0xc7, 0xc8, 0xc9, 0xca, 0xd2, 0xd3, 0xd4, 0xd5, 0xd6, 0xd7, 0xd8, 0xd9, 0xda,
    0xe2, 0xe3, 0xe4, 0xe5, 0xe6, 0xe7, 0xe8, 0xe9, 0xea, 0xf2, 0xf3, 0xf4, 0xf5, 0xf6, 0xf7, 0xf8, 0xf9, 0xfa};

constexpr std::uint32_t scale_of(std::uint8_t q) {
  if (q == 0) return 5000;
  if (q > 99) return 2;
  return q < 50 ? 5000U / q : 200U - 2U * q;
}

QuantisationTable scaled(const QuantisationTable& base, std::uint32_t scale) {
  QuantisationTable table;
  std::transform(base.begin(), base.end(), table.begin(), [scale](unsigned char entry) {
    return static_cast<unsigned char>(std::clamp<std::uint32_t>((entry * scale + 50) / 100, 1, 255));
  });
  return table;
}

}  // namespace

void append_jfif_header(FrameWriter& out, const JpegShape& shape, const QuantisationTables& tables) {
  out.append(kStartOfImage);
  append_quantisation(out, 0, tables.luminance);
  append_quantisation(out, 1, tables.chrominance);
  append_restart_interval(out, shape.restart_interval);
  append_frame(out, shape);
  for (const HuffmanTable& table : kHuffmanTables) append_huffman(out, table);
  append_scan(out);
}

QuantisationTables quantisation_tables(std::uint8_t q) {
  const std::uint32_t scale = scale_of(q);
  return {scaled(kLuminance, scale), scaled(kChrominance, scale)};
}

const std::array<HuffmanTable, 4> kHuffmanTables = {{
    {0x00, {0, 1, 5, 1, 1, 1, 1, 1, 1, 0, 0, 0, 0, 0, 0, 0}, kDcSymbols},
    {0x10, {0, 2, 1, 3, 3, 2, 4, 3, 5, 5, 4, 4, 0, 0, 1, 0x7d}, kLuminanceAcSymbols},
    {0x01, {0, 3, 1, 1, 1, 1, 1, 1, 1, 1, 1, 0, 0, 0, 0, 0}, kDcSymbols},
    {0x11, {0, 2, 1, 2, 4, 4, 3, 4, 7, 5, 4, 4, 0, 1, 2, 0x77}, kChrominanceAcSymbols},
}};

}  // namespace vexa
