// The records that typedHandle pointers lead to. Each names its kind, so that one function tells them apart.
#pragma once

#include <pthread.h>

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <new>

#include "vexa/runtime.h"

/// A thread started by _beginthreadex. `kind` and `id` are written before the handle is published and never again; the
/// rest belongs to the thread lock.
struct _windowsThreadHandle : typedHandle {
  static constexpr std::int32_t kKind = HANDLE_TYPE_THREAD;

  pthread_t id = 0;
  std::uint32_t exit_code = STILL_ACTIVE;
  bool closed = false;
  bool finished = false;                            // the routine is done, whatever its exit code
  pthread_cond_t ended = PTHREAD_COND_INITIALIZER;  // `finished` has become true
};

namespace vexa {

/// A manual-reset event: signalled as long as its pipe holds a byte.
struct EventHandle : typedHandle {
  static constexpr std::int32_t kKind = HANDLE_TYPE_EVENT;

  std::int32_t read_fd = -1;
  std::int32_t write_fd = -1;
};

/// A file opened by CreateFile.
struct FileHandle : typedHandle {
  static constexpr std::int32_t kKind = HANDLE_TYPE_FILE;

  std::int32_t fd = -1;
};

/// A search begun by FindFirstFile.
struct FindHandle : typedHandle {
  static constexpr std::int32_t kKind = HANDLE_TYPE_FIND;

  pathglob_t result = {};
  std::size_t index = 0;  // of the match that was returned last
};

/// The record of `h`; null when `h` is null or of another kind.
template <typename Record>
Record* record_of(typedHandle* h) {
  return h != nullptr && h->kind == Record::kKind ? static_cast<Record*>(h) : nullptr;
}

/// A new record of its kind, which the caller owns; null when memory is short.
template <typename Record>
Record* new_record() {
  auto* record = new (std::nothrow) Record;
  if (record != nullptr) record->kind = Record::kKind;
  return record;
}

/// Waits until the routine of a thread started by _beginthreadex is done, `longest` at most; all of that when it was
/// done before. The handle must stay open meanwhile.
void wait_for_thread_end(typedHandle* h, std::chrono::milliseconds longest);

/// As record_of<FileHandle>; a refusal is reported on standard error.
FileHandle* check_file_handle(typedHandle* h);

}  // namespace vexa
