// A lock guard that clang's thread-safety analysis understands.
#pragma once

#include "vexa/simple_lock.h"

namespace vexa {

/// Holds `lock` for the guard's life.
class VEXA_THREAD_ATTRIBUTE(scoped_lockable) Guard {
 public:
  explicit Guard(CSimpleLock& lock) VEXA_ACQUIRE(lock) : lock_(lock) { lock_.Lock(); }
  ~Guard() VEXA_RELEASE() { lock_.Unlock(); }
  Guard(const Guard&) = delete;
  Guard& operator=(const Guard&) = delete;

 private:
  CSimpleLock& lock_;
};

}  // namespace vexa
