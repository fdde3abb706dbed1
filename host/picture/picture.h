// SPDX-License-Identifier: Apache-2.0
// A decoded picture, and the detection windows that are drawn on it: window_drawing.cpp.
#ifndef HOST_PICTURE_PICTURE_H_
#define HOST_PICTURE_PICTURE_H_

#include <cstdint>
#include <vector>

#include "vexa/io_info.h"

namespace vexa::host {

struct Picture {
  int width = 0;
  int height = 0;
  std::vector<std::uint8_t> rgb;  // three bytes a pixel, row by row from the top, without gaps
};

// Each window that has an area becomes a frame in its own colour with its number in the upper left corner: bold when it
// is switched on, else thin; crossed out when it masks. Areas are in ten-thousandths of the picture's sides; what lies
// outside is cut off.
void draw_windows(Picture& picture, const SLibDDetectionParam& setting);

}  // namespace vexa::host

#endif  // HOST_PICTURE_PICTURE_H_
