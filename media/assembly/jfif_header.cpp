#include "media/assembly/jfif_header.h"

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

}  // namespace vexa
