// SPDX-License-Identifier: Apache-2.0
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

/// Holds `lock` for the guard's life and waits for it in turn. The waiting thread holds `turn`, so that a thread which
/// releases the lock and wants it again at once comes second. A thread that holds `lock` already must not make one.
class VEXA_THREAD_ATTRIBUTE(scoped_lockable) TurnGuard {
 public:
  TurnGuard(CSimpleLock& lock, CSimpleLock& turn) VEXA_ACQUIRE(lock) : lock_(lock) {
    const Guard next(turn);
    lock_.Lock();
  }
  ~TurnGuard() VEXA_RELEASE() { lock_.Unlock(); }
  TurnGuard(const TurnGuard&) = delete;
  TurnGuard& operator=(const TurnGuard&) = delete;

 private:
  CSimpleLock& lock_;
};

}  // namespace vexa
