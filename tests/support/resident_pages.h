// How many pages of a block are in memory.
#pragma once

#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace vexa_test {

inline std::size_t page_size() { return static_cast<std::size_t>(sysconf(_SC_PAGESIZE)); }

/// Of the whole pages inside the block.
inline std::size_t resident_pages(const void* block, std::size_t size) {
  const auto begin = reinterpret_cast<std::uintptr_t>(block);
  const std::uintptr_t first = (begin + page_size() - 1) / page_size() * page_size();
  const std::uintptr_t end = (begin + size) / page_size() * page_size();
  if (end <= first) return 0;
  std::vector<unsigned char> states((end - first) / page_size());
  if (mincore(reinterpret_cast<void*>(first), end - first, states.data()) != 0) return states.size();
  return static_cast<std::size_t>(
      std::count_if(states.begin(), states.end(), [](unsigned char s) { return (s & 1) != 0; }));
}

}  // namespace vexa_test
