// SPDX-License-Identifier: Apache-2.0
// MPEG-4 Visual, simple profile (ISO/IEC 14496-2): intra pictures, and predicted ones whose squares stay but for one.
#include <algorithm>
#include <cstddef>
#include <cstdlib>
#include <string_view>
#include <vector>

#include "virtual_camera/codec/bit_writer.h"
#include "virtual_camera/codec/drawn_video.h"

namespace vexa::camera {
namespace {

constexpr std::uint32_t kSimpleProfile = 6;   // with the largest of its levels
constexpr std::uint32_t kMpeg4Quantiser = 4;  // up to this, a mean is coded in steps of 1
constexpr int kUnknownMean = 128;             // of a block outside the picture, or not intra

void put_code(BitWriter& out, std::string_view code) {
  for (const char bit : code) out.bits(bit == '1' ? 1U : 0U, 1);
}

void put_unit(BitWriter& out, std::uint32_t code) {
  out.bits(1, 24);
  out.bits(code, 8);
}

// Fills up to the next start code (5.2.4).
void put_stuffing(BitWriter& out) {
  out.bits(0, 1);
  out.pad(1);
}

// The means of the blocks of one plane, from which those after are predicted (7.4.3.1).
class BlockMeans {
 public:
  BlockMeans(std::uint32_t columns, std::uint32_t rows)
      : columns_(columns), means_(std::size_t{columns} * rows, kUnknownMean) {}

  void set(std::uint32_t column, std::uint32_t row, int mean) { means_[place(column, row)] = mean; }

  [[nodiscard]] int prediction(std::uint32_t column, std::uint32_t row) const {
    const int left = column > 0 ? means_[place(column - 1, row)] : kUnknownMean;
    const int above = row > 0 ? means_[place(column, row - 1)] : kUnknownMean;
    const int corner = column > 0 && row > 0 ? means_[place(column - 1, row - 1)] : kUnknownMean;
    return std::abs(left - corner) < std::abs(corner - above) ? above : left;
  }

 private:
  [[nodiscard]] std::size_t place(std::uint32_t column, std::uint32_t row) const {
    return std::size_t{row} * columns_ + column;
  }

  std::uint32_t columns_;
  std::vector<int> means_;
};

// Tables B-13 and B-14: how many bits the difference has.
constexpr std::string_view kBrightnessSizes[] = {"011", "11", "10", "010", "001", "0001", "00001", "000001", "0000001"};
constexpr std::string_view kColourSizes[] = {"11", "10", "01", "001", "0001", "00001", "000001", "0000001", "00000001"};

class Mpeg4Picture {
 public:
  Mpeg4Picture(BitWriter& out, const SquareGrid& grid)
      : out_(out), brightness_(2 * grid.columns, 2 * grid.rows), blue_(grid.columns, grid.rows), red_(blue_) {}

  // After the square's type: no prediction of coefficients, and none but the means.
  void put_square(std::uint32_t column, std::uint32_t row, const SquareColour& colour) {
    put_code(out_, "0");
    put_code(out_, "0011");
    for (std::uint32_t block = 0; block < 4; ++block) {
      put_mean(brightness_, 2 * column + block % 2, 2 * row + block / 2, colour.y, kBrightnessSizes);
    }
    put_mean(blue_, column, row, colour.cb, kColourSizes);
    put_mean(red_, column, row, colour.cr, kColourSizes);
  }

 private:
  template <std::size_t kCount>
  void put_mean(BlockMeans& plane, std::uint32_t column, std::uint32_t row, int mean,
                const std::string_view (&sizes)[kCount]) {
    const int difference = mean - plane.prediction(column, row);
    plane.set(column, row, mean);
    const int size = bits_in(static_cast<std::uint32_t>(std::abs(difference)));
    put_code(out_, sizes[size]);
    out_.bits(static_cast<std::uint32_t>(difference > 0 ? difference : difference - 1), size);
  }

  BitWriter& out_;
  BlockMeans brightness_;
  BlockMeans blue_;
  BlockMeans red_;
};

void put_headers(BitWriter& out, const DrawnVideo& video) {
  put_unit(out, 0xB0);
  out.bits(kSimpleProfile, 8);
  put_unit(out, 0xB5);
  out.bits(0b000010, 6);  // video, no signal type
  put_stuffing(out);
  put_unit(out, 0x00);
  put_unit(out, 0x20);
  out.bits(0, 1);  // not every picture is a key picture
  out.bits(1, 8);  // a simple object
  out.bits(0, 1);
  out.bits(1, 4);  // square pixels
  out.bits(0, 1);
  out.bits(0, 2);  // rectangular
  out.bits(1, 1);
  out.bits(static_cast<std::uint32_t>(video.frame_rate), 16);
  out.bits(0b101, 3);  // pictures carry their times
  out.bits(static_cast<std::uint32_t>(video.width), 13);
  out.bits(1, 1);
  out.bits(static_cast<std::uint32_t>(video.height), 13);
  out.bits(1, 1);
  out.bits(0b01000, 5);  // progressive, no overlapped motion, no sprite, 8 bits, quantised as in H.263 ...
  out.bits(0b1100, 4);   // ... no estimates, no resynchronisation, one partition, one layer
  put_stuffing(out);
}

enum class VopType : std::uint32_t { kIntra = 0, kPredicted = 1 };

void put_picture_header(BitWriter& out, const DrawnVideo& video, std::uint64_t index, VopType type) {
  const auto rate = static_cast<std::uint64_t>(video.frame_rate);
  put_unit(out, 0xB6);
  out.bits(static_cast<std::uint32_t>(type), 2);
  if (type == VopType::kIntra && index > 0) out.bits(1, 1);  // a second has passed
  out.bits(0b01, 2);
  const int time_bits = std::max(1, bits_in(static_cast<std::uint32_t>(video.frame_rate - 1)));
  out.bits(static_cast<std::uint32_t>(index % rate), time_bits);
  out.bits(0b11, 2);                                // marker; coded
  if (type == VopType::kPredicted) out.bits(0, 1);  // rounding
  out.bits(0, 3);                                   // means have a code of their own throughout
  out.bits(kMpeg4Quantiser, 5);
  if (type == VopType::kPredicted) out.bits(1, 3);  // range of motion
}

void put_intra_squares(BitWriter& out, const SquareGrid& grid) {
  Mpeg4Picture picture(out, grid);
  for (std::uint32_t row = 0; row < grid.rows; ++row) {
    for (std::uint32_t column = 0; column < grid.columns; ++column) {
      put_code(out, "1");  // intra, no coefficients of colour
      picture.put_square(column, row, square_colour(column, row));
    }
  }
}

void put_predicted_squares(BitWriter& out, const SquareGrid& grid, std::uint64_t index) {
  Mpeg4Picture picture(out, grid);
  const std::uint32_t changed = changed_square(grid, index);
  for (std::uint32_t square = 0; square < grid.size(); ++square) {
    const bool stays = square != changed;
    out.bits(stays ? 1U : 0U, 1);
    if (stays) continue;
    put_code(out, "00011");  // intra, no coefficients of colour
    picture.put_square(square % grid.columns, square / grid.columns, changed_colour(index));
  }
}

}  // namespace

std::string draw_mpeg4(const DrawnVideo& video, std::uint64_t index) {
  const SquareGrid grid(video);
  BitWriter out;
  const bool key = index % static_cast<std::uint64_t>(video.frame_rate) == 0;
  if (key) put_headers(out, video);
  put_picture_header(out, video, index, key ? VopType::kIntra : VopType::kPredicted);
  if (key) {
    put_intra_squares(out, grid);
  } else {
    put_predicted_squares(out, grid, index);
  }
  put_stuffing(out);
  return out.take();
}

}  // namespace vexa::camera
