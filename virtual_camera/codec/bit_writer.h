// SPDX-License-Identifier: Apache-2.0
// Bits put together to bytes, the highest first.
#ifndef VIRTUAL_CAMERA_CODEC_BIT_WRITER_H_
#define VIRTUAL_CAMERA_CODEC_BIT_WRITER_H_

#include <bit>
#include <cstdint>
#include <string>
#include <utility>

namespace vexa::camera {

// Bits that a number takes; 0 for 0.
[[nodiscard]] constexpr int bits_in(std::uint32_t value) { return static_cast<int>(std::bit_width(value)); }

// Collects the bits of one header or slice in memory. A local value of one thread; writes no file.
class BitWriter {
 public:
  // The lowest `count` bits of the value, up to 32.
  void bits(std::uint32_t value, int count) {
    for (int bit = count - 1; bit >= 0; --bit) {
      current_ = current_ << 1U | (value >> static_cast<unsigned>(bit) & 1U);
      if (++filled_ == 8) flush();
    }
  }
  // Up to a whole byte.
  void pad(std::uint32_t bit) {
    while (filled_ != 0) bits(bit, 1);
  }
  // What has been written, up to the last whole byte.
  [[nodiscard]] std::string take() { return std::move(bytes_); }

 private:
  void flush() {
    bytes_ += static_cast<char>(current_ & 0xffU);
    current_ = 0;
    filled_ = 0;
  }

  std::string bytes_;
  unsigned current_ = 0;
  int filled_ = 0;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_CODEC_BIT_WRITER_H_
