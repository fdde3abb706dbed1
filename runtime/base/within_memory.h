// Where running out of memory ends.
#pragma once

#include <new>
#include <utility>

namespace vexa {

/// Runs `work`; false when memory ran out in it. What it had made until then has undone itself.
template <typename Work>
[[nodiscard]] bool within_memory(Work&& work) {
  try {
    std::forward<Work>(work)();
    return true;
  } catch (const std::bad_alloc&) {
    return false;
  }
}

}  // namespace vexa
