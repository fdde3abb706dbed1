// A decoded picture.
#ifndef HOST_PICTURE_PICTURE_H_
#define HOST_PICTURE_PICTURE_H_

#include <cstdint>
#include <vector>

namespace vexa::host {

struct Picture {
  int width = 0;
  int height = 0;
  std::vector<std::uint8_t> rgb;  // three bytes a pixel, row by row from the top, without gaps
};

}  // namespace vexa::host

#endif  // HOST_PICTURE_PICTURE_H_
