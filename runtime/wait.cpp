// SPDX-License-Identifier: Apache-2.0
// Waiting on events with one poll; the signal stays in the pipe.
#include <poll.h>

#include <cstddef>
#include <cstdint>
#include <memory>
#include <new>
#include <optional>

#include "runtime/handle.h"

namespace {

// The events of one wait, in the order of their handles. Null handles have no entry.
struct Entries {
  std::unique_ptr<pollfd[]> list;
  nfds_t count = 0;
};

// Nullopt when a handle is not an event or memory is short.
std::optional<Entries> entries_of(unsigned long count, typedHandle* const* handles) {
  Entries entries;
  if (count == 0) return entries;
  if (handles == nullptr) return std::nullopt;
  entries.list.reset(new (std::nothrow) pollfd[count]);
  if (entries.list == nullptr) return std::nullopt;
  for (unsigned long i = 0; i < count; ++i) {
    if (handles[i] == nullptr) continue;
    const auto* event = vexa::record_of<vexa::EventHandle>(handles[i]);
    if (event == nullptr) return std::nullopt;
    entries.list[entries.count++] = {event->read_fd, POLLIN, 0};
  }
  return entries;
}

}  // namespace

unsigned long WaitForMultipleObjects(unsigned long count, typedHandle* const* handles, int waitAll,
                                     unsigned long timeoutMs) {
  if (waitAll != 0) return WAIT_FAILED;
  std::optional<Entries> entries = entries_of(count, handles);
  if (!entries) return WAIT_FAILED;
  // Kept: a signal handler that runs meanwhile ends the wait as a time-out, however much time is left.
  // Kept: a poll that fails counts as one that found no signal; hosts see WAIT_TIMEOUT, not WAIT_FAILED.
  // Kept: the number goes to poll as a signed one, so that everything from 0x80000000 on waits without limit.
  poll(entries->list.get(), entries->count, static_cast<int>(static_cast<std::uint32_t>(timeoutMs)));
  // Safe: after the wait no record is read any more, so a handle that was closed meanwhile is not touched again.
  nfds_t entry = 0;
  for (unsigned long i = 0; i < count && entry < entries->count; ++i) {
    if (handles[i] == nullptr) continue;
    if ((entries->list[entry].revents & POLLIN) != 0) return i;
    ++entry;
  }
  return WAIT_TIMEOUT;
}

unsigned long WaitForSingleObject(typedHandle* h, unsigned long timeoutMs) {
  return WaitForMultipleObjects(1, &h, 0, timeoutMs);
}
