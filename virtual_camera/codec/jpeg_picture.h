// SPDX-License-Identifier: Apache-2.0
// A JPEG file taken apart into what travels over RTP.
#ifndef VIRTUAL_CAMERA_CODEC_JPEG_PICTURE_H_
#define VIRTUAL_CAMERA_CODEC_JPEG_PICTURE_H_

#include <array>
#include <cstdint>
#include <map>
#include <optional>
#include <span>
#include <vector>

namespace vexa::camera {

struct JpegPicture {
  unsigned width = 0;
  unsigned height = 0;
  std::uint16_t restart_interval = 0;  // 0: none
  // Quantisation tables of luminance and chrominance, 64 bytes each, as DQT holds them.
  std::array<std::uint8_t, 128> tables{};
  // Counts and symbols of each Huffman table, by its class and number as DHT holds them.
  std::map<std::uint8_t, std::vector<std::uint8_t>> huffman;
  std::vector<std::uint8_t> scan;  // what follows SOS, the end marker included

  bool operator==(const JpegPicture&) const = default;
};

// Nullopt for a file that RFC 2435 cannot carry: not baseline, not 4:2:0 of three components, sides that are no
// multiple of 8 or above 2040, quantisation tables of 16 bits, or Huffman tables of its own.
[[nodiscard]] std::optional<JpegPicture> read_jpeg(std::span<const std::uint8_t> file);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_CODEC_JPEG_PICTURE_H_
