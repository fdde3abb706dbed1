// SPDX-License-Identifier: Apache-2.0
// The one mutex of the driver and its logger.
#pragma once

#include <pthread.h>

#include "vexa/export.h"

/// A recursive mutex: the thread that holds it may take it again, and lets it go as often as it took it.
///
/// Any thread may call any operation. `lock` and `unlock` are the same operations under the names that
/// std::lock_guard and std::unique_lock ask for. Destroying a held lock is an error of the caller.
class VEXA_API VEXA_LOCK CSimpleLock {
 public:
  CSimpleLock();
  virtual ~CSimpleLock();
  CSimpleLock(const CSimpleLock&) = delete;
  CSimpleLock& operator=(const CSimpleLock&) = delete;

  /// Waits without limit until the lock is the caller's.
  void Lock() VEXA_ACQUIRE();
  /// Gives back one taking of the lock; only the thread that holds it may call this.
  void Unlock() VEXA_RELEASE();

  void lock() VEXA_ACQUIRE() { Lock(); }
  void unlock() VEXA_RELEASE() { Unlock(); }

 private:
  pthread_mutex_t mutex_;
};
