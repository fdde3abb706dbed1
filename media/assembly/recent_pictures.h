// SPDX-License-Identifier: Apache-2.0
// The packets that were used lately: they distinguish a duplicate from a restarted sequence.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

namespace vexa {

/// Remembers the pictures used last by timestamp and span of sequence numbers. Owned by the packet collector, on its
/// thread; of fixed size, so it never allocates.
class RecentPictures {
 public:
  void add(std::uint32_t timestamp, std::uint16_t first, std::uint16_t last) {
    pictures_[next_++ % kCount] = {timestamp, first, static_cast<std::uint16_t>(last - first), true};
  }

  bool holds(std::uint32_t timestamp, std::uint16_t sequence) const {
    for (const Picture& picture : pictures_) {
      if (picture.used && picture.timestamp == timestamp &&
          static_cast<std::uint16_t>(sequence - picture.first) <= picture.span) {
        return true;
      }
    }
    return false;
  }

 private:
  struct Picture {
    std::uint32_t timestamp = 0;
    std::uint16_t first = 0;
    std::uint16_t span = 0;
    bool used = false;
  };

  static constexpr std::size_t kCount = 128;  // more than the 1.2 s that a packet may be late, at 100 pictures a second
  std::array<Picture, kCount> pictures_;
  std::size_t next_ = 0;
};

}  // namespace vexa
