#include "transport/cancel_signal.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include <cerrno>
#include <cstdint>

namespace vexa {
namespace {

bool is_readable(int descriptor) {
  pollfd entry{descriptor, POLLIN, 0};
  return poll(&entry, 1, 0) == 1 && (entry.revents & POLLIN) != 0;
}

}  // namespace

CancelSignal::CancelSignal() : descriptor_(eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)) {}

CancelSignal::~CancelSignal() {
  if (descriptor_ >= 0) close(descriptor_);
}

void CancelSignal::raise() {
  const int before = errno;
  raised_ = true;
  const std::uint64_t one = 1;
  [[maybe_unused]] const ssize_t written = write(descriptor_, &one, sizeof one);
  errno = before;
}

void CancelSignal::lower() {
  const int before = errno;
  raised_ = false;
  std::uint64_t count = 0;
  [[maybe_unused]] const ssize_t taken = read(descriptor_, &count, sizeof count);
  errno = before;
}

bool CancelSignal::is_raised() const { return descriptor_ >= 0 ? is_readable(descriptor_) : raised_.load(); }

bool Cancels::raised() const {
  return (call != nullptr && call->is_raised()) || (token != nullptr && token->is_raised());
}

}  // namespace vexa
