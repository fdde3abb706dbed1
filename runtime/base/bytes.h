// SPDX-License-Identifier: Apache-2.0
// Bytes from outside, and a forward reader of them whose failure is sticky.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

namespace vexa {

using Bytes = std::span<const unsigned char>;

/// Reads big-endian numbers forward. Beyond the end each read returns 0, and `ok` stays false. A local value over bytes
/// of the caller's; never reads outside them.
class ByteReader {
 public:
  explicit ByteReader(Bytes bytes) : bytes_(bytes) {}

  std::uint8_t u8() { return static_cast<std::uint8_t>(number(1)); }
  std::uint16_t u16() { return static_cast<std::uint16_t>(number(2)); }
  std::uint32_t u24() { return number(3); }
  std::uint32_t u32() { return number(4); }

  /// The next `length` bytes; none when fewer are left.
  Bytes take(std::size_t length) {
    if (!ok_ || length > bytes_.size() - position_) {
      ok_ = false;
      return {};
    }
    const Bytes taken = bytes_.subspan(position_, length);
    position_ += length;
    return taken;
  }

  Bytes rest() const { return ok_ ? bytes_.subspan(position_) : Bytes{}; }
  bool ok() const { return ok_; }

 private:
  std::uint32_t number(std::size_t width) {
    std::uint32_t value = 0;
    for (const unsigned char byte : take(width)) value = (value << 8) | byte;
    return value;
  }

  Bytes bytes_;
  std::size_t position_ = 0;
  bool ok_ = true;
};

}  // namespace vexa
