#include "transport/wait_budget.h"

#include <poll.h>

#include <algorithm>
#include <cerrno>

#include "runtime/base/deadline.h"

namespace vexa {

WaitBudget::WaitBudget(int milliseconds)
    : deadline_(std::chrono::steady_clock::now() + std::chrono::milliseconds(std::max(milliseconds, 0))) {}

int WaitBudget::wait_readable(int descriptor) const { return wait(descriptor, POLLIN, -1); }

int WaitBudget::wait_writable(int descriptor) const { return wait(descriptor, POLLOUT, -1); }

int WaitBudget::wait_readable_unless(int descriptor, int stop) const { return wait(descriptor, POLLIN, stop); }

int WaitBudget::wait(int descriptor, short events, int stop) const {
  // Safe: poll would ignore -1 and wait in vain; a closed socket is an error at once.
  if (descriptor < 0) {
    errno = EBADF;
    return -1;
  }
  pollfd entries[] = {{descriptor, events, 0}, {stop, POLLIN, 0}};
  for (;;) {
    const int count = poll(entries, 2, std::max(milliseconds_until(deadline_), 0));
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) return count;
    if ((entries[1].revents & POLLIN) != 0) return 0;
    if (entries[0].revents == 0) {
      entries[1].fd = -1;  // closed or broken: it cannot signal a stop, now or later
      continue;
    }
    if ((entries[0].revents & POLLNVAL) != 0) {
      errno = EBADF;
      return -1;
    }
    return 1;
  }
}

}  // namespace vexa
