// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/codec/i420_picture.h"

#include <algorithm>

namespace vexa::camera {
namespace {

int even_side(int pixels) { return (std::max(pixels, 2) + 1) / 2 * 2; }

}  // namespace

void I420Picture::resize(int width, int height) {
  width_ = even_side(width);
  height_ = even_side(height);
  brightness_ = static_cast<std::size_t>(width_) * static_cast<std::size_t>(height_);
  bytes_.resize(brightness_ / 2 * 3);
}

Colour I420Picture::at(int column, int row) const {
  const auto place = [&](int shift) {
    return static_cast<std::size_t>(row >> shift) * static_cast<std::size_t>(width_ >> shift) +
           static_cast<std::size_t>(column >> shift);
  };
  return {y()[place(0)], u()[place(1)], v()[place(1)]};
}

}  // namespace vexa::camera
