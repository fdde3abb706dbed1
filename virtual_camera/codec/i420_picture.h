// SPDX-License-Identifier: Apache-2.0
// A picture in I420: a plane of brightness, and two of colour at half its sides.
#ifndef VIRTUAL_CAMERA_CODEC_I420_PICTURE_H_
#define VIRTUAL_CAMERA_CODEC_I420_PICTURE_H_

#include <cstddef>
#include <cstdint>
#include <vector>

namespace vexa::camera {

struct Colour {
  std::uint8_t y = 16;  // 16 to 235
  std::uint8_t u = 128;
  std::uint8_t v = 128;

  bool operator==(const Colour&) const = default;
};

// The canvas of one encoder, used on its thread. Keeps its memory from picture to picture.
class I420Picture {
 public:
  I420Picture() = default;
  I420Picture(int width, int height) { resize(width, height); }

  // Sides in pixels, at least 2 each; an odd one is rounded up. What the planes then hold is undetermined.
  void resize(int width, int height);

  [[nodiscard]] int width() const { return width_; }
  [[nodiscard]] int height() const { return height_; }
  // Rows follow each other without gaps: width() bytes of brightness, half as many of colour.
  [[nodiscard]] std::uint8_t* y() { return bytes_.data(); }
  [[nodiscard]] std::uint8_t* u() { return bytes_.data() + brightness_; }
  [[nodiscard]] std::uint8_t* v() { return bytes_.data() + brightness_ + brightness_ / 4; }
  [[nodiscard]] const std::uint8_t* y() const { return bytes_.data(); }
  [[nodiscard]] const std::uint8_t* u() const { return bytes_.data() + brightness_; }
  [[nodiscard]] const std::uint8_t* v() const { return bytes_.data() + brightness_ + brightness_ / 4; }
  [[nodiscard]] const std::vector<std::uint8_t>& bytes() const { return bytes_; }  // Y, U, V

  [[nodiscard]] Colour at(int column, int row) const;

 private:
  int width_ = 0;
  int height_ = 0;
  std::size_t brightness_ = 0;  // bytes of its plane
  std::vector<std::uint8_t> bytes_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_CODEC_I420_PICTURE_H_
