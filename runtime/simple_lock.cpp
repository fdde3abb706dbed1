// SPDX-License-Identifier: Apache-2.0
#include "vexa/simple_lock.h"

CSimpleLock::CSimpleLock() {
  pthread_mutexattr_t attributes;
  pthread_mutexattr_init(&attributes);
  pthread_mutexattr_settype(&attributes, PTHREAD_MUTEX_RECURSIVE);
  pthread_mutex_init(&mutex_, &attributes);
  pthread_mutexattr_destroy(&attributes);
}

CSimpleLock::~CSimpleLock() { pthread_mutex_destroy(&mutex_); }

void CSimpleLock::Lock() { pthread_mutex_lock(&mutex_); }

void CSimpleLock::Unlock() { pthread_mutex_unlock(&mutex_); }
