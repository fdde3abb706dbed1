// Waiting on events with one poll; the signal stays in the pipe.
#include <poll.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <new>
#include <optional>

#include "runtime/base/deadline.h"
#include "runtime/handle.h"

namespace {

using Clock = std::chrono::steady_clock;

// The events of one wait, in the order of their handles. Null handles have no entry.
struct Entries {
  std::unique_ptr<pollfd[]> list;
  nfds_t count = 0;
};

// Nothing when a handle is not an event or memory is short.
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

// One poll that a signal handler does not cut short; a negative time-out is none.
void poll_through_signals(Entries& entries, int timeout_ms) {
  const auto deadline = Clock::now() + std::chrono::milliseconds(timeout_ms);
  // Kept: a poll that fails otherwise counts as one that found nothing; hosts see WAIT_TIMEOUT, not WAIT_FAILED.
  while (poll(entries.list.get(), entries.count, timeout_ms) < 0 && errno == EINTR) {
    if (timeout_ms > 0) timeout_ms = std::max(vexa::milliseconds_until(deadline), 0);
  }
}

}  // namespace

unsigned long WaitForMultipleObjects(unsigned long count, typedHandle* const* handles, int waitAll,
                                     unsigned long timeoutMs) {
  if (waitAll != 0) return WAIT_FAILED;
  std::optional<Entries> entries = entries_of(count, handles);
  if (!entries) return WAIT_FAILED;
  // Kept: the number goes to poll as a signed one, so that everything from 0x80000000 on waits without limit.
  poll_through_signals(*entries, static_cast<int>(static_cast<std::uint32_t>(timeoutMs)));
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
