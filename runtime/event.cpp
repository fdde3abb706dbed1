// SPDX-License-Identifier: Apache-2.0
// Manual-reset events: a pipe that holds at least one byte while the event is signalled.
#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

#include <cerrno>
#include <memory>

#include "runtime/handle.h"

using vexa::EventHandle;

bool eventFd(typedHandle* h, int& fd) {
  const auto* event = vexa::record_of<EventHandle>(h);
  if (event == nullptr) return false;
  fd = event->read_fd;
  return true;
}

// Kept: the initial state is ignored, every event starts non-signalled; drivers reset nothing before their first wait.
typedHandle* CreateEvent(_SECURITY_ATTRIBUTES* attrs, int manualReset, int /*initialState*/, const char* name) {
  if (attrs != nullptr || manualReset != 1 || name != nullptr) return nullptr;
  std::unique_ptr<EventHandle> event(vexa::new_record<EventHandle>());
  if (event == nullptr) return nullptr;
  // Safe: the write end does not block either, so a full pipe (an event set very often) cannot stop its caller; both
  // ends get the flag with the pipe itself, so no failure in between can leave a pipe open.
  int ends[2];
  if (pipe2(ends, O_CLOEXEC | O_NONBLOCK) != 0) return nullptr;
  event->read_fd = ends[0];
  event->write_fd = ends[1];
  return event.release();
}

int SetEvent(typedHandle* h) {
  const auto* event = vexa::record_of<EventHandle>(h);
  if (event == nullptr) return 0;
  // Safe: a pipe whose read end somebody closed is refused here; writing to it would raise SIGPIPE in the host.
  pollfd writable = {event->write_fd, POLLOUT, 0};
  if (poll(&writable, 1, 0) > 0 && (writable.revents & (POLLERR | POLLNVAL)) != 0) return 0;
  const char signal = 0;
  if (write(event->write_fd, &signal, 1) == 1) return 1;
  return errno == EAGAIN ? 1 : 0;
}

int ResetEvent(typedHandle* h) {
  const auto* event = vexa::record_of<EventHandle>(h);
  if (event == nullptr) return 0;
  char signals[4096];
  ssize_t got = 0;
  do {
    got = read(event->read_fd, signals, sizeof signals);
  } while (got > 0);
  return got == 0 || errno == EAGAIN ? 1 : 0;
}

int CloseEventHandle(typedHandle* h) {
  const std::unique_ptr<EventHandle> event(vexa::record_of<EventHandle>(h));
  if (event == nullptr) return 0;
  const bool read_closed = close(event->read_fd) == 0;
  const bool write_closed = close(event->write_fd) == 0;
  return read_closed && write_closed ? 1 : 0;
}
