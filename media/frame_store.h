// Spare frame buffers.
#pragma once

#include <cstddef>
#include <memory>
#include <utility>
#include <vector>

namespace vexa {

/// Keeps a few frame buffers for reuse, so that a picture need not fetch fresh pages from the system.
/// Owned by the driver; any thread that holds the lock of the frame queue. It never blocks.
class FrameStore {
 public:
  FrameStore();

  /// A buffer of exactly `capacity` bytes, allocated with array new, and the caller's; may throw std::bad_alloc.
  unsigned char* take(std::size_t capacity);
  /// Takes a buffer of `capacity` bytes back; null is ignored.
  void give_back(unsigned char* buffer, std::size_t capacity);
  void clear() { spares_.clear(); }

 private:
  using Spare = std::pair<std::size_t, std::unique_ptr<unsigned char[]>>;
  std::vector<Spare> spares_;
};

}  // namespace vexa
