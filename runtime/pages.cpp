#include "runtime/pages.h"

#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>

namespace vexa {
namespace {

/// The whole pages inside `block`; empty when there is none.
std::span<unsigned char> whole_pages(std::span<unsigned char> block) {
  static const auto page = static_cast<std::size_t>(sysconf(_SC_PAGESIZE));
  const std::size_t misplaced = reinterpret_cast<std::uintptr_t>(block.data()) % page;
  const std::size_t before = misplaced == 0 ? 0 : page - misplaced;
  if (block.size() < before + page) return {};
  return block.subspan(before, (block.size() - before) / page * page);
}

void clear(std::span<unsigned char> bytes) { std::fill(bytes.begin(), bytes.end(), static_cast<unsigned char>(0)); }

}  // namespace

bool give_pages_back(std::span<unsigned char> block) {
  const std::span<unsigned char> pages = whole_pages(block);
  return pages.empty() || madvise(pages.data(), pages.size(), MADV_DONTNEED) == 0;
}

void clear_untouched(std::span<unsigned char> block) {
  const std::span<unsigned char> pages = whole_pages(block);
  if (pages.empty()) return clear(block);
  // Safe: a host whose operator new hands out shared memory keeps the old bytes; a mark that survives shows it.
  pages.front() = 1;
  if (!give_pages_back(pages) || pages.front() != 0) return clear(block);
  clear(block.first(static_cast<std::size_t>(pages.data() - block.data())));
  clear(block.last(static_cast<std::size_t>(block.data() + block.size() - (pages.data() + pages.size()))));
}

}  // namespace vexa
