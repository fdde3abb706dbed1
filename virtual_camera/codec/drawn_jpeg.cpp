// SPDX-License-Identifier: Apache-2.0
// Baseline JPEG (ITU-T T.81), drawn: each block holds its mean alone.
#include <array>
#include <cstdlib>
#include <string_view>

#include "virtual_camera/codec/bit_writer.h"
#include "virtual_camera/codec/drawn_video.h"

namespace vexa::camera {
namespace {

using namespace std::string_view_literals;

// Annex K.3: sixteen counts, then the symbols.
constexpr auto kBrightnessMeans = "\0\1\5\1\1\1\1\1\1\0\0\0\0\0\0\0\0\1\2\3\4\5\6\7\x08\x09\x0a\x0b"sv;
constexpr auto kColourMeans = "\0\3\1\1\1\1\1\1\1\1\1\0\0\0\0\0\0\1\2\3\4\5\6\7\x08\x09\x0a\x0b"sv;
constexpr auto kBrightnessCoefficients =
    "\0\2\1\3\3\2\4\3\5\5\4\4\0\0\1\x7d"
    "\x01\x02\x03\x00\x04\x11\x05\x12\x21\x31\x41\x06\x13\x51\x61\x07\x22\x71\x14\x32\x81\x91\xa1\x08\x23\x42\xb1"
    "\xc1\x15\x52\xd1\xf0\x24\x33\x62\x72\x82\x09\x0a\x16\x17\x18\x19\x1a\x25\x26\x27\x28\x29\x2a\x34\x35\x36\x37"
    "\x38\x39\x3a\x43\x44\x45\x46\x47\x48\x49\x4a\x53\x54\x55\x56\x57\x58\x59\x5a\x63\x64\x65\x66\x67\x68\x69\x6a"
    "\x73\x74\x75\x76\x77\x78\x79\x7a\x83\x84\x85\x86\x87\x88\x89\x8a\x92\x93\x94\x95\x96\x97\x98\x99\x9a\xa2\xa3"
    "\xa4\xa5\xa6\xa7\xa8\xa9\xaa\xb2\xb3\xb4\xb5\xb6\xb7\xb8\xb9\xba\xc2\xc3\xc4\xc5\xc6\xc7\xc8\xc9\xca\xd2\xd3"
    "\xd4\xd5\xd6\xd7\xd8\xd9\xda\xe1\xe2\xe3\xe4\xe5\xe6\xe7\xe8\xe9\xea\xf1\xf2\xf3\xf4\xf5\xf6\xf7\xf8\xf9\xfa"sv;
constexpr auto kColourCoefficients =
    "\0\2\1\2\4\4\3\4\7\5\4\4\0\1\2\x77"
    "\x00\x01\x02\x03\x11\x04\x05\x21\x31\x06\x12\x41\x51\x07\x61\x71\x13\x22\x32\x81\x08\x14\x42\x91\xa1\xb1\xc1"
    "\x09\x23\x33\x52\xf0\x15\x62\x72\xd1\x0a\x16\x24\x34\xe1\x25\xf1\x17\x18\x19\x1a\x26\x27\x28\x29\x2a\x35\x36"
    "\x37\x38\x39\x3a\x43\x44\x45\x46\x47\x48\x49\x4a\x53\x54\x55\x56\x57\x58\x59\x5a\x63\x64\x65\x66\x67\x68\x69"
    "\x6a\x73\x74\x75\x76\x77\x78\x79\x7a\x82\x83\x84\x85\x86\x87\x88\x89\x8a\x92\x93\x94\x95\x96\x97\x98\x99\x9a"
    "\xa2\xa3\xa4\xa5\xa6\xa7\xa8\xa9\xaa\xb2\xb3\xb4\xb5\xb6\xb7\xb8\xb9\xba\xc2\xc3\xc4\xc5\xc6\xc7\xc8\xc9\xca"
    "\xd2\xd3\xd4\xd5\xd6\xd7\xd8\xd9\xda\xe2\xe3\xe4\xe5\xe6\xe7\xe8\xe9\xea\xf2\xf3\xf4\xf5\xf6\xf7\xf8\xf9\xfa"sv;

constexpr std::size_t kCodeLengths = 16;
constexpr int kMeanStep = 8;  // of the quantiser: a mean of 1 is 1 step
constexpr int kMiddleGrey = 128;

void append_number(std::string& to, std::size_t value) {
  to += static_cast<char>(value >> 8U & 0xffU);
  to += static_cast<char>(value & 0xffU);
}

// A marker and the segment after it, with its length.
void append_segment(std::string& to, char marker, std::string_view body) {
  to += '\xff';
  to += marker;
  append_number(to, body.size() + 2);
  to += body;
}

struct MeanCode {
  std::uint32_t code = 0;
  int length = 0;
};

// The code of each size of a difference (Annex C.2).
std::array<MeanCode, 12> mean_codes(std::string_view table) {
  std::array<MeanCode, 12> codes{};
  std::uint32_t code = 0;
  std::size_t symbol = 0;
  for (std::size_t length = 1; length <= kCodeLengths; ++length, code <<= 1U) {
    for (char left = table[length - 1]; left > 0; --left) {
      codes[static_cast<unsigned char>(table[kCodeLengths + symbol++])] = {code++, static_cast<int>(length)};
    }
  }
  return codes;
}

// One component's blocks: their means are written as differences.
class JpegComponent {
 public:
  JpegComponent(std::string_view table, MeanCode end_of_block) : codes_(mean_codes(table)), end_(end_of_block) {}

  void put(BitWriter& out, int value) {
    const int mean = value - kMiddleGrey;
    const int difference = mean - last_;
    last_ = mean;
    const int size = bits_in(static_cast<std::uint32_t>(std::abs(difference)));
    const MeanCode& code = codes_[static_cast<std::size_t>(size)];
    out.bits(code.code, code.length);
    out.bits(static_cast<std::uint32_t>(difference > 0 ? difference : difference - 1), size);
    out.bits(end_.code, end_.length);
  }

 private:
  std::array<MeanCode, 12> codes_;
  MeanCode end_;
  int last_ = 0;
};

std::string tables_and_headers(const DrawnVideo& video, const SquareGrid& grid) {
  std::string bytes = "\xff\xd8";
  append_segment(bytes, '\xe0', "JFIF\0\1\1\0\0\1\0\1\0\0"sv);
  for (const char table : {'\0', '\1'}) append_segment(bytes, '\xdb', table + std::string(64, kMeanStep));
  std::string frame = "\x08";
  append_number(frame, static_cast<std::size_t>(video.height));
  append_number(frame, static_cast<std::size_t>(video.width));
  append_segment(bytes, '\xc0', frame.append("\3\1\x22\0\2\x11\1\3\x11\1"sv));
  append_segment(bytes, '\xc4', '\x00' + std::string(kBrightnessMeans));
  append_segment(bytes, '\xc4', '\x10' + std::string(kBrightnessCoefficients));
  append_segment(bytes, '\xc4', '\x01' + std::string(kColourMeans));
  append_segment(bytes, '\xc4', '\x11' + std::string(kColourCoefficients));
  std::string interval;
  append_number(interval, grid.columns);
  append_segment(bytes, '\xdd', interval);
  append_segment(bytes, '\xda', "\3\1\0\2\x11\3\x11\0\x3f\0"sv);
  return bytes;
}

constexpr std::uint32_t kNoSquare = 0xffffffff;

// A row of squares, which needs no other; `changed` is a square of it that looks different.
std::string row_of_squares(const SquareGrid& grid, std::uint32_t row, std::uint32_t changed, std::uint64_t index) {
  BitWriter out;
  JpegComponent brightness(kBrightnessMeans, {0b1010, 4});
  JpegComponent blue(kColourMeans, {0b00, 2});
  JpegComponent red(kColourMeans, {0b00, 2});
  for (std::uint32_t column = 0; column < grid.columns; ++column) {
    const SquareColour colour = column == changed ? changed_colour(index) : square_colour(column, row);
    for (int block = 0; block < 4; ++block) brightness.put(out, colour.y);
    blue.put(out, colour.cb);
    red.put(out, colour.cr);
  }
  out.pad(1);
  std::string bytes;
  for (const char byte : out.take()) {
    bytes += byte;
    if (byte == '\xff') bytes += '\0';
  }
  return bytes;
}

}  // namespace

std::string draw_jpeg(const DrawnVideo& video, std::uint64_t index) {
  const SquareGrid grid(video);
  const std::uint32_t changed = changed_square(grid, index);
  std::string bytes = tables_and_headers(video, grid);
  std::string like_above;
  for (std::uint32_t row = 0; row < grid.rows; ++row) {
    if (row % kPatchSide == 0) like_above = row_of_squares(grid, row, kNoSquare, index);
    const bool changes = row == changed / grid.columns;
    bytes += changes ? row_of_squares(grid, row, changed % grid.columns, index) : like_above;
    if (row + 1 < grid.rows) bytes.append("\xff") += static_cast<char>(0xd0U + row % 8);
  }
  return bytes.append("\xff\xd9");
}

}  // namespace vexa::camera
