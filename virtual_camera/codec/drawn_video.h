// SPDX-License-Identifier: Apache-2.0
// Pictures of any size and rate, drawn without an encoder: squares of one brightness and colour each, of which one
// changes from picture to picture.
#ifndef VIRTUAL_CAMERA_CODEC_DRAWN_VIDEO_H_
#define VIRTUAL_CAMERA_CODEC_DRAWN_VIDEO_H_

#include <cstdint>
#include <string>

namespace vexa::camera {

struct DrawnVideo {
  int width = 0;       // pixels, 2 to 8191; H.264 rounds an odd side up
  int height = 0;      // pixels, 2 to 8191
  int frame_rate = 1;  // pictures a second, 1 to 255
};

// Picture `index` of an endless run. Of H.264 and MPEG-4 each second begins with a key picture after its parameter
// sets or headers; the others need all since then.
[[nodiscard]] std::string draw_h264(const DrawnVideo& video, std::uint64_t index);   // Baseline, Annex B
[[nodiscard]] std::string draw_mpeg4(const DrawnVideo& video, std::uint64_t index);  // simple profile
// Baseline, 4:2:0, with the standard Huffman tables and a restart interval for each row of squares: what RTP can carry,
// for sides that are multiples of 8 up to 2040.
[[nodiscard]] std::string draw_jpeg(const DrawnVideo& video, std::uint64_t index);

// Macroblocks, the squares of 16 pixels that pictures are made of; those at the edge may reach beyond it.
struct SquareGrid {
  explicit SquareGrid(const DrawnVideo& video)
      : columns((static_cast<std::uint32_t>(video.width) + 15) / 16),
        rows((static_cast<std::uint32_t>(video.height) + 15) / 16) {}
  [[nodiscard]] std::uint32_t size() const { return columns * rows; }

  std::uint32_t columns;
  std::uint32_t rows;
};

inline constexpr std::uint32_t kPatchSide = 4;  // squares of one colour, across and down

// What a square of JPEG and MPEG-4 looks like, 1 to 254 each.
struct SquareColour {
  int y = 128;
  int cb = 128;
  int cr = 128;
};
[[nodiscard]] SquareColour square_colour(std::uint32_t column, std::uint32_t row);

// The square that changes in picture `index`, counted row by row, and what it becomes.
[[nodiscard]] std::uint32_t changed_square(const SquareGrid& grid, std::uint64_t index);
[[nodiscard]] SquareColour changed_colour(std::uint64_t index);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_CODEC_DRAWN_VIDEO_H_
