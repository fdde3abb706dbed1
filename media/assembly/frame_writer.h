// A frame buffer that is filled from its start and never past its end.
#pragma once

#include <algorithm>
#include <cstddef>
#include <span>

#include "runtime/base/bytes.h"

namespace vexa {

/// Made for one frame, over a buffer that it does not own; used by the thread that assembles the frame.
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
