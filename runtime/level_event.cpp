#include "runtime/level_event.h"

#include <sys/eventfd.h>
#include <unistd.h>

#include <utility>

namespace vexa {

void LevelEvent::close() {
  if (descriptor_ != -1) ::close(std::exchange(descriptor_, -1));
}

int LevelEvent::open(bool raised) {
  if (descriptor_ == -1) descriptor_ = eventfd(raised ? 1 : 0, EFD_CLOEXEC | EFD_NONBLOCK);
  return descriptor_;
}

// Neither blocks. Neither fails but where a host has read, written or closed what is not its own.
void LevelEvent::raise() const {
  if (descriptor_ != -1) eventfd_write(descriptor_, 1);
}

void LevelEvent::lower() const {
  eventfd_t count = 0;
  if (descriptor_ != -1) eventfd_read(descriptor_, &count);
}

}  // namespace vexa
