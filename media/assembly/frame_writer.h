// SPDX-License-Identifier: Apache-2.0
// A frame buffer that is filled from its start and never beyond its end.
#pragma once

#include <algorithm>
#include <cstddef>
#include <span>

#include "runtime/base/bytes.h"

namespace vexa {

/// Appends payloads to a buffer of the caller's. Lives as long as the assembly of one picture, on its thread; never
/// writes beyond the buffer and never allocates.
class FrameWriter {
 public:
  explicit FrameWriter(std::span<unsigned char> room) : room_(room) {}

  /// Appends all of `bytes`; nothing, and `fits` is false from then on, when there is no room for them.
  void append(Bytes bytes) {
    if (bytes.size() > room_.size() - length_) fits_ = false;
    if (!fits_) return;
    std::copy(bytes.begin(), bytes.end(), room_.data() + length_);
    length_ += bytes.size();
  }

  std::size_t length() const { return length_; }
  bool fits() const { return fits_; }

 private:
  std::span<unsigned char> room_;
  std::size_t length_ = 0;
  bool fits_ = true;
};

}  // namespace vexa
