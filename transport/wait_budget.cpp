#include "transport/wait_budget.h"

#include <poll.h>

#include <algorithm>
#include <cerrno>
#include <iterator>
#include <span>

#include "runtime/base/deadline.h"

namespace vexa {
namespace {

constexpr int kLookInterval = 50;  // milliseconds, at a signal without a descriptor

int descriptor_of(const CancelSignal* signal) { return signal == nullptr ? -1 : signal->descriptor(); }

bool needs_looks(const CancelSignal* signal) { return signal != nullptr && signal->descriptor() < 0; }

bool is_flagged(const CancelSignal* signal) { return needs_looks(signal) && signal->is_raised(); }

}  // namespace

WaitBudget::WaitBudget(WaitLimit limit)
    : deadline_(std::chrono::steady_clock::now() + std::chrono::milliseconds(std::max(limit.milliseconds, 0))),
      cancels_(limit.cancels) {}

int WaitBudget::wait_readable(int descriptor) const { return wait(descriptor, POLLIN, -1); }

int WaitBudget::wait_writable(int descriptor) const { return wait(descriptor, POLLOUT, -1); }

int WaitBudget::wait_readable_unless(int descriptor, int stop) const { return wait(descriptor, POLLIN, stop); }

int WaitBudget::wait_closed(int descriptor) const { return wait(descriptor, POLLRDHUP, -1); }

void WaitBudget::pause() const { wait_for(-1, 0, -1); }  // poll passes over -1

int WaitBudget::wait(int descriptor, short events, int stop) const {
  // Safe: poll would pass over -1 and wait in vain; a closed socket is an error at once.
  if (descriptor < 0) {
    errno = EBADF;
    return -1;
  }
  return wait_for(descriptor, events, stop);
}

int WaitBudget::wait_for(int descriptor, short events, int stop) const {
  pollfd peer_and_ends[] = {{descriptor, events, 0},
                            {stop, POLLIN, 0},
                            {cancels_.stop, POLLIN, 0},
                            {descriptor_of(cancels_.call), POLLIN, 0},
                            {descriptor_of(cancels_.token), POLLIN, 0}};
  pollfd& peer = peer_and_ends[0];
  const std::span<pollfd> ends = std::span(peer_and_ends).subspan(1);
  const bool looks = needs_looks(cancels_.call) || needs_looks(cancels_.token);
  for (;;) {
    if (is_flagged(cancels_.call) || is_flagged(cancels_.token)) return 0;
    const int left = std::max(milliseconds_until(deadline_), 0);
    const bool looks_again = looks && left > kLookInterval;
    const int count = poll(peer_and_ends, std::size(peer_and_ends), looks_again ? kLookInterval : left);
    if ((count < 0 && errno == EINTR) || (count == 0 && looks_again)) continue;
    if (count <= 0) return count;
    if (std::any_of(ends.begin(), ends.end(), [](const pollfd& end) { return (end.revents & POLLIN) != 0; })) return 0;
    if (peer.revents == 0) {
      for (pollfd& end : ends) end.fd = end.revents != 0 ? -1 : end.fd;  // closed or broken: it ends no wait
      continue;
    }
    if ((peer.revents & POLLNVAL) != 0) {
      errno = EBADF;
      return -1;
    }
    return 1;
  }
}

}  // namespace vexa
