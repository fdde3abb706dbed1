// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/codec/jpeg_picture.h"

#include <algorithm>
#include <cstddef>
#include <numeric>
#include <utility>

namespace vexa::camera {
namespace {

using Bytes = std::span<const std::uint8_t>;

// Markers of ITU-T T.81, table B.1.
constexpr std::uint8_t kFrame = 0xC0;
constexpr std::uint8_t kHuffman = 0xC4;
constexpr std::uint8_t kScan = 0xDA;
constexpr std::uint8_t kQuantisation = 0xDB;
constexpr std::uint8_t kRestart = 0xDD;

constexpr std::size_t kTable = 64;
// Symbols of the standard Huffman tables, K.3 to K.6; tables made for one picture have fewer.
constexpr std::size_t kDcSymbols = 12;
constexpr std::size_t kAcSymbols = 162;
constexpr std::size_t kCounts = 16;
constexpr unsigned kLongestSide = 2040;

unsigned number_at(Bytes bytes, std::size_t at) { return static_cast<unsigned>(bytes[at] << 8U | bytes[at + 1]); }

class Reader {
 public:
  explicit Reader(Bytes file) : file_(file) {}

  std::optional<JpegPicture> read() {
    std::size_t at = 2;  // after SOI
    while (at + 4 <= file_.size()) {
      const std::uint8_t marker = file_[at + 1];
      const std::size_t length = number_at(file_, at + 2);
      if (file_[at] != 0xFF || length < 2 || length > file_.size() - at - 2) return std::nullopt;
      if (!take(marker, file_.subspan(at + 4, length - 2))) return std::nullopt;
      at += 2 + length;
      if (marker == kScan) return finish(file_.subspan(at));
    }
    return std::nullopt;
  }

 private:
  bool take(std::uint8_t marker, Bytes segment) {
    switch (marker) {
      case kFrame:
        return take_frame(segment);
      case kQuantisation:
        return take_tables(segment);
      case kHuffman:
        return take_huffman(segment);
      case kRestart:
        if (segment.size() != 2) return false;
        picture_.restart_interval = static_cast<std::uint16_t>(number_at(segment, 0));
        return true;
      default:
        return marker < 0xC1 || marker > 0xCF;  // another process than baseline
    }
  }

  bool take_frame(Bytes segment) {
    static constexpr std::size_t kThreeComponents = 15;
    if (segment.size() != kThreeComponents || segment[0] != 8 || segment[5] != 3) return false;
    picture_.height = number_at(segment, 1);
    picture_.width = number_at(segment, 3);
    const bool halved = segment[7] == 0x22 && segment[10] == 0x11 && segment[13] == 0x11;
    luminance_ = segment[8];
    chrominance_ = segment[11];
    return halved && segment[14] == chrominance_;
  }

  bool take_tables(Bytes segment) {
    while (!segment.empty()) {
      if (segment.size() < 1 + kTable || segment[0] > 3) return false;
      const Bytes table = segment.subspan(1, kTable);
      tables_[segment[0]].assign(table.begin(), table.end());
      segment = segment.subspan(1 + kTable);
    }
    return true;
  }

  bool take_huffman(Bytes segment) {
    while (segment.size() > kCounts) {
      const std::size_t symbols = (segment[0] & 0xF0U) == 0 ? kDcSymbols : kAcSymbols;
      const Bytes counts = segment.subspan(1, kCounts);
      if (std::accumulate(counts.begin(), counts.end(), std::size_t{0}) != symbols) return false;
      const std::size_t length = 1 + kCounts + symbols;
      if (segment.size() < length) return false;
      const Bytes table = segment.subspan(1, length - 1);
      picture_.huffman[segment[0]].assign(table.begin(), table.end());
      segment = segment.subspan(length);
    }
    return segment.empty();
  }

  std::optional<JpegPicture> finish(Bytes scan) {
    const auto fits = [](unsigned side) { return side != 0 && side <= kLongestSide && side % 8 == 0; };
    const bool whole =
        tables_.count(luminance_) != 0 && tables_.count(chrominance_) != 0 && picture_.huffman.size() == 4;
    if (!whole || !fits(picture_.width) || !fits(picture_.height)) return std::nullopt;
    std::copy(tables_[luminance_].begin(), tables_[luminance_].end(), picture_.tables.begin());
    std::copy(tables_[chrominance_].begin(), tables_[chrominance_].end(), picture_.tables.begin() + kTable);
    picture_.scan.assign(scan.begin(), scan.end());
    return std::move(picture_);
  }

  Bytes file_;
  JpegPicture picture_;
  std::map<std::uint8_t, std::vector<std::uint8_t>> tables_;
  std::uint8_t luminance_ = 0;
  std::uint8_t chrominance_ = 0;
};

}  // namespace

std::optional<JpegPicture> read_jpeg(Bytes file) {
  if (file.size() < 2 || file[0] != 0xFF || file[1] != 0xD8) return std::nullopt;
  return Reader(file).read();
}

}  // namespace vexa::camera
