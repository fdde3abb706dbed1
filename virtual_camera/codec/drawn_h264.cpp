// SPDX-License-Identifier: Apache-2.0
// H.264, Baseline profile (ITU-T H.264), drawn.
#include <string>

#include "virtual_camera/codec/bit_writer.h"
#include "virtual_camera/codec/drawn_video.h"

namespace vexa::camera {
namespace {

constexpr std::uint32_t kSquareSide = 16;  // pixels

// NAL unit headers: reference importance and type (table 7-1).
constexpr std::uint8_t kSequenceParameterSet = 0x67;
constexpr std::uint8_t kPictureParameterSet = 0x68;
constexpr std::uint8_t kIdrSlice = 0x65;
constexpr std::uint8_t kSlice = 0x41;

constexpr std::uint32_t kSliceI = 7;  // all slices of the picture are of this kind
constexpr std::uint32_t kSliceP = 5;
// Macroblock type I_16x16_2_0_0: predicted from its neighbours' mean, no coefficient but the mean's (table 7-11); five
// further in a P slice.
constexpr std::uint32_t kMean16x16 = 3;
constexpr std::uint32_t kMean16x16InP = 8;
constexpr int kQuantiser = 46;  // a coefficient of 1 is a step of 8 in brightness

// Exp-Golomb codes (9.1).
void put_ue(BitWriter& out, std::uint32_t value) {
  const int length = bits_in(value + 1) - 1;
  out.bits(0, length);
  out.bits(value + 1, length + 1);
}

void put_se(BitWriter& out, int value) {
  const auto magnitude = static_cast<std::uint32_t>(value < 0 ? -value : value);
  put_ue(out, value > 0 ? 2 * magnitude - 1 : 2 * magnitude);
}

// The unit's bytes, after the stop bit.
std::string finished_unit(BitWriter& out) {
  out.bits(1, 1);
  out.pad(0);
  return out.take();
}

std::string sequence_parameters(const DrawnVideo& video, const SquareGrid& grid) {
  BitWriter out;
  out.bits(66, 8);    // Baseline
  out.bits(0xC0, 8);  // decodable as Constrained Baseline and Main
  out.bits(40, 8);    // level 4
  put_ue(out, 0);     // identifier
  put_ue(out, 4);     // frame numbers have 8 bits
  put_ue(out, 2);     // pictures are shown in the order they come
  put_ue(out, 1);     // one reference picture
  out.bits(0, 1);
  put_ue(out, grid.columns - 1);
  put_ue(out, grid.rows - 1);
  out.bits(0b111, 3);  // frames only, 8x8 inference, cropping
  put_ue(out, 0);
  put_ue(out, (grid.columns * kSquareSide - static_cast<std::uint32_t>(video.width)) / 2);
  put_ue(out, 0);
  put_ue(out, (grid.rows * kSquareSide - static_cast<std::uint32_t>(video.height)) / 2);
  out.bits(0b10000, 5);  // usability information: none but the timing
  out.bits(1, 1);
  out.bits(1, 32);
  out.bits(2 * static_cast<std::uint32_t>(video.frame_rate), 32);  // fields
  out.bits(0b10000, 5);
  return finished_unit(out);
}

std::string picture_parameters() {
  BitWriter out;
  put_ue(out, 0);
  put_ue(out, 0);
  out.bits(0, 2);  // variable-length codes; no field order
  put_ue(out, 0);
  put_ue(out, 0);
  put_ue(out, 0);
  out.bits(0, 3);  // no weighting
  put_se(out, kQuantiser - 26);
  put_se(out, 0);
  put_se(out, 0);
  out.bits(0b100, 3);  // slices control the deblocking filter
  return finished_unit(out);
}

// A square as bright as its neighbours, or a step brighter or darker.
enum class Square { kSame, kBrighter, kDarker };

void put_square(BitWriter& out, std::uint32_t type, Square square) {
  put_ue(out, type);
  put_ue(out, 0);  // the colour is the neighbours' mean
  put_se(out, 0);  // the quantiser stays
  if (square == Square::kSame) {
    out.bits(1, 1);  // no coefficient
    return;
  }
  out.bits(0b01, 2);                                 // one, and it is 1
  out.bits(square == Square::kDarker ? 1U : 0U, 1);  // its sign
  out.bits(1, 1);                                    // no zeros before it
}

Square pattern(std::uint32_t column, std::uint32_t row) {
  switch ((column / 4 * 7 + row / 4 * 13) % 5) {
    case 0:
      return Square::kBrighter;
    case 1:
      return Square::kDarker;
    default:
      return Square::kSame;
  }
}

std::string key_slice(const SquareGrid& grid, std::uint64_t second) {
  BitWriter out;
  put_ue(out, 0);
  put_ue(out, kSliceI);
  put_ue(out, 0);
  out.bits(0, 8);                        // frame number
  put_ue(out, second % 2 == 0 ? 0 : 1);  // two key pictures in a row differ in it
  out.bits(0, 2);                        // neither kept for output nor for long
  put_se(out, 0);
  put_ue(out, 1);  // no deblocking
  for (std::uint32_t row = 0; row < grid.rows; ++row) {
    for (std::uint32_t column = 0; column < grid.columns; ++column) {
      put_square(out, kMean16x16, pattern(column, row));
    }
  }
  return finished_unit(out);
}

std::string changed_slice(const SquareGrid& grid, std::uint32_t picture) {
  BitWriter out;
  put_ue(out, 0);
  put_ue(out, kSliceP);
  put_ue(out, 0);
  out.bits(picture & 0xFFU, 8);
  out.bits(0, 3);  // the references as they are
  put_se(out, 0);
  put_ue(out, 1);
  const std::uint32_t changed = changed_square(grid, picture);
  put_ue(out, changed);  // squares left as they were
  put_square(out, kMean16x16InP, picture % 2 == 0 ? Square::kBrighter : Square::kDarker);
  if (changed + 1 < grid.size()) put_ue(out, grid.size() - changed - 1);
  return finished_unit(out);
}

// Appends a NAL unit with its start code; bytes that could be taken for a start code are escaped (7.4.1).
void append_unit(std::string& to, std::uint8_t header, const std::string& body) {
  to.append("\0\0\0\1", 4) += static_cast<char>(header);
  int zeros = 0;
  for (const char byte : body) {
    if (zeros == 2 && static_cast<unsigned char>(byte) <= 3) {
      to += '\3';
      zeros = 0;
    }
    to += byte;
    zeros = byte == 0 ? zeros + 1 : 0;
  }
}

}  // namespace

std::string draw_h264(const DrawnVideo& video, std::uint64_t index) {
  const SquareGrid grid(video);
  const auto rate = static_cast<std::uint64_t>(video.frame_rate);
  const auto picture = static_cast<std::uint32_t>(index % rate);
  std::string access_unit;
  if (picture == 0) {
    append_unit(access_unit, kSequenceParameterSet, sequence_parameters(video, grid));
    append_unit(access_unit, kPictureParameterSet, picture_parameters());
    append_unit(access_unit, kIdrSlice, key_slice(grid, index / rate));
  } else {
    append_unit(access_unit, kSlice, changed_slice(grid, picture));
  }
  return access_unit;
}

}  // namespace vexa::camera
