// The one place that catches running out of memory.
#pragma once

#include <new>
#include <utility>

namespace vexa {

/// Runs `work`; false when memory ran out in it. Whatever it had made until then is destroyed.
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
