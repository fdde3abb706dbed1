#include "virtual_camera/drawn_h264.h"

#include <utility>

namespace vexa::camera {
namespace {

constexpr std::uint32_t kMacroblock = 16;  // pixels
constexpr int kSeconds = 2;

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

// Writes the bits of one NAL unit.
class BitWriter {
 public:
  void bits(std::uint32_t value, int count) {
    for (int bit = count - 1; bit >= 0; --bit) {
      current_ =
          static_cast<std::uint8_t>(static_cast<unsigned>(current_) << 1U | (value >> static_cast<unsigned>(bit) & 1U));
      if (++filled_ == 8) flush();
    }
  }
  // Exp-Golomb codes (9.1).
  void ue(std::uint32_t value) {
    int length = 0;
    while ((value + 1) >> static_cast<unsigned>(length + 1) != 0) ++length;
    bits(0, length);
    bits(value + 1, length + 1);
  }
  void se(int value) {
    const auto magnitude = static_cast<std::uint32_t>(value < 0 ? -value : value);
    ue(value > 0 ? 2 * magnitude - 1 : 2 * magnitude);
  }
  // The stop bit, and zeros up to a whole byte.
  std::vector<std::uint8_t> finish() {
    bits(1, 1);
    while (filled_ != 0) bits(0, 1);
    return std::move(bytes_);
  }

 private:
  void flush() {
    bytes_.push_back(current_);
    current_ = 0;
    filled_ = 0;
  }

  std::vector<std::uint8_t> bytes_;
  std::uint8_t current_ = 0;
  int filled_ = 0;
};

struct Grid {
  explicit Grid(const DrawnVideo& video)
      : columns((static_cast<std::uint32_t>(video.width) + kMacroblock - 1) / kMacroblock),
        rows((static_cast<std::uint32_t>(video.height) + kMacroblock - 1) / kMacroblock) {}
  [[nodiscard]] std::uint32_t size() const { return columns * rows; }

  std::uint32_t columns;  // macroblocks
  std::uint32_t rows;
};

std::vector<std::uint8_t> sequence_parameters(const DrawnVideo& video, const Grid& grid) {
  BitWriter out;
  out.bits(66, 8);    // Baseline
  out.bits(0xC0, 8);  // decodable as Constrained Baseline and Main
  out.bits(40, 8);    // level 4
  out.ue(0);          // identifier
  out.ue(4);          // frame numbers have 8 bits
  out.ue(2);          // pictures are shown in the order they come
  out.ue(1);          // one reference picture
  out.bits(0, 1);
  out.ue(grid.columns - 1);
  out.ue(grid.rows - 1);
  out.bits(0b111, 3);  // frames only, 8x8 inference, cropping
  out.ue(0);
  out.ue((grid.columns * kMacroblock - static_cast<std::uint32_t>(video.width)) / 2);
  out.ue(0);
  out.ue((grid.rows * kMacroblock - static_cast<std::uint32_t>(video.height)) / 2);
  out.bits(0b10000, 5);  // usability information: none but the timing
  out.bits(1, 1);
  out.bits(1, 32);
  out.bits(2 * static_cast<std::uint32_t>(video.frame_rate), 32);  // fields
  out.bits(0b10000, 5);
  return out.finish();
}

std::vector<std::uint8_t> picture_parameters() {
  BitWriter out;
  out.ue(0);
  out.ue(0);
  out.bits(0, 2);  // variable-length codes; no field order
  out.ue(0);
  out.ue(0);
  out.ue(0);
  out.bits(0, 3);  // no weighting
  out.se(kQuantiser - 26);
  out.se(0);
  out.se(0);
  out.bits(0b100, 3);  // slices control the deblocking filter
  return out.finish();
}

// A square as bright as its neighbours, or a step brighter or darker.
enum class Square { kSame, kBrighter, kDarker };

void put_square(BitWriter& out, std::uint32_t type, Square square) {
  out.ue(type);
  out.ue(0);  // the colour is the neighbours' mean
  out.se(0);  // the quantiser stays
  if (square == Square::kSame) {
    out.bits(1, 1);  // no coefficient
    return;
  }
  out.bits(0b01, 2);                                 // one, and it is 1
  out.bits(square == Square::kDarker ? 1U : 0U, 1);  // its sign
  out.bits(1, 1);                                    // no zeros before it
}

Square pattern(std::uint32_t column, std::uint32_t row, std::uint32_t second) {
  switch ((column / 4 * 7 + row / 4 * 13 + second * 5) % 5) {
    case 0:
      return Square::kBrighter;
    case 1:
      return Square::kDarker;
    default:
      return Square::kSame;
  }
}

std::vector<std::uint8_t> key_slice(const Grid& grid, std::uint32_t second) {
  BitWriter out;
  out.ue(0);
  out.ue(kSliceI);
  out.ue(0);
  out.bits(0, 8);  // frame number
  out.ue(second);  // two key pictures in a row differ in it
  out.bits(0, 2);  // neither kept for output nor for long
  out.se(0);
  out.ue(1);  // no deblocking
  for (std::uint32_t row = 0; row < grid.rows; ++row) {
    for (std::uint32_t column = 0; column < grid.columns; ++column) {
      put_square(out, kMean16x16, pattern(column, row, second));
    }
  }
  return out.finish();
}

std::vector<std::uint8_t> changed_slice(const Grid& grid, std::uint32_t picture) {
  BitWriter out;
  out.ue(0);
  out.ue(kSliceP);
  out.ue(0);
  out.bits(picture & 0xFFU, 8);
  out.bits(0, 3);  // the references as they are
  out.se(0);
  out.ue(1);
  const std::uint32_t changed = picture * 11 % grid.size();
  out.ue(changed);  // squares left as they were
  put_square(out, kMean16x16InP, picture % 2 == 0 ? Square::kBrighter : Square::kDarker);
  if (changed + 1 < grid.size()) out.ue(grid.size() - changed - 1);
  return out.finish();
}

// Appends a NAL unit with its start code; bytes that could be taken for a start code are escaped (7.4.1).
void append_unit(std::vector<std::uint8_t>& to, std::uint8_t header, const std::vector<std::uint8_t>& body) {
  to.insert(to.end(), {0, 0, 0, 1, header});
  int zeros = 0;
  for (const std::uint8_t byte : body) {
    if (zeros == 2 && byte <= 3) {
      to.push_back(3);
      zeros = 0;
    }
    to.push_back(byte);
    zeros = byte == 0 ? zeros + 1 : 0;
  }
}

}  // namespace

std::vector<std::uint8_t> draw_h264(const DrawnVideo& video) {
  const Grid grid(video);
  const auto rate = static_cast<std::uint32_t>(video.frame_rate);
  std::vector<std::uint8_t> bytes;
  for (std::uint32_t second = 0; second < kSeconds; ++second) {
    for (std::uint32_t picture = 0; picture < rate; ++picture) {
      std::vector<std::uint8_t> access_unit;
      if (picture == 0) {
        append_unit(access_unit, kSequenceParameterSet, sequence_parameters(video, grid));
        append_unit(access_unit, kPictureParameterSet, picture_parameters());
        append_unit(access_unit, kIdrSlice, key_slice(grid, second));
      } else {
        append_unit(access_unit, kSlice, changed_slice(grid, picture));
      }
      bytes.insert(bytes.end(), access_unit.begin(), access_unit.end());
    }
  }
  return bytes;
}

}  // namespace vexa::camera
