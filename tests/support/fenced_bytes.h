// SPDX-License-Identifier: Apache-2.0
// Bytes that end right before a page without access, so that a read after them is caught in every build.
#pragma once

#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <span>

namespace vexa_test {

class FencedBytes {
 public:
  explicit FencedBytes(std::span<const unsigned char> bytes)
      : page_(static_cast<std::size_t>(sysconf(_SC_PAGESIZE))),
        room_((bytes.size() + page_) / page_ * page_),
        map_(static_cast<unsigned char*>(
            mmap(nullptr, room_ + page_, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0))),
        bytes_(map_ + room_ - bytes.size(), bytes.size()) {
    std::copy(bytes.begin(), bytes.end(), bytes_.begin());
    mprotect(map_ + room_, page_, PROT_NONE);
  }
  FencedBytes(const FencedBytes&) = delete;
  FencedBytes& operator=(const FencedBytes&) = delete;
  ~FencedBytes() { munmap(map_, room_ + page_); }

  std::span<unsigned char> bytes() const { return bytes_; }
  unsigned char* data() const { return bytes_.data(); }
  std::uint32_t size() const { return static_cast<std::uint32_t>(bytes_.size()); }

 private:
  std::size_t page_;
  std::size_t room_;
  unsigned char* map_;
  std::span<unsigned char> bytes_;
};

}  // namespace vexa_test
