// Spare frame buffers.
#pragma once

#include <cstddef>
#include <memory>
#include <utility>
#include <vector>

#include "runtime/base/recent_need.h"

namespace vexa {

/// Keeps a few frame buffers that are done with, so that a picture need not fetch fresh pages from the system. What a
/// stream no longer needs goes back to the system: spares that were not taken for some time, and the rear of buffers
/// that held larger pictures. Owned by the
/// driver; any thread that holds the lock of the frame queue. Frames of one size are the rule, so a buffer fits only a
/// request for its own size.
class FrameStore {
 public:
  static constexpr unsigned kIdlePeriod = 32;  ///< frames

  FrameStore();
  FrameStore(const FrameStore&) = delete;
  FrameStore& operator=(const FrameStore&) = delete;
  ~FrameStore() { clear(); }

  /// A buffer of exactly `capacity` bytes, allocated with array new, and the caller's; may throw std::bad_alloc.
  unsigned char* take(std::size_t capacity);
  /// Takes a buffer of `capacity` bytes back, whose first `used` held a frame; null is ignored.
  void give_back(unsigned char* buffer, std::size_t capacity, std::size_t used = 0);
  void clear();

 private:
  using Spare = std::pair<std::size_t, std::unique_ptr<unsigned char[]>>;

  void note_use(std::size_t used);
  void drop_idle_spares();

  std::vector<Spare> spares_;
  RecentNeed need_;
  std::size_t kept_bytes_ = 0;    // of each buffer, while trims_left_ is not 0
  unsigned trims_left_ = 0;       // buffers to come back whose rear goes: those that were out when the stream shrank
  unsigned frames_ = 0;           // since the spares were last looked through
  std::size_t least_spares_ = 0;  // that were there at once since then
};

}  // namespace vexa
