// H.264 pictures of any size and rate, drawn without an encoder (ITU-T H.264, Baseline profile).
#ifndef VIRTUAL_CAMERA_DRAWN_H264_H_
#define VIRTUAL_CAMERA_DRAWN_H264_H_

#include <cstdint>
#include <vector>

namespace vexa::camera {

struct DrawnVideo {
  int width = 0;       // pixels, from 2; an odd side is rounded up
  int height = 0;      // pixels, from 2
  int frame_rate = 1;  // pictures a second, as the parameter sets say
};

// Two seconds in Annex-B format, to be repeated: each begins with parameter sets and a key picture of grey squares, in
// which one square changes from picture to picture.
[[nodiscard]] std::vector<std::uint8_t> draw_h264(const DrawnVideo& video);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_DRAWN_H264_H_
