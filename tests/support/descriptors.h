// Descriptors as a host sees them, and a process that has none left.
#pragma once

#include <fcntl.h>
#include <poll.h>
#include <sys/resource.h>

#include <set>
#include <string>

#include <filesystem>

namespace vexa_test {

/// Whether poll would return at once for it.
inline short poll_events(int descriptor) {
  pollfd entry = {descriptor, POLLIN, 0};
  return poll(&entry, 1, 0) == 1 ? entry.revents : static_cast<short>(0);
}
inline bool is_readable(int descriptor) { return (poll_events(descriptor) & POLLIN) != 0; }

/// The open descriptors that a program started by exec would inherit.
inline std::set<std::string> inherited_descriptors() {
  std::set<std::string> found;
  for (const auto& entry : std::filesystem::directory_iterator("/proc/self/fd")) {
    const std::string name = entry.path().filename().string();
    const int flags = fcntl(std::stoi(name), F_GETFD);
    if (flags >= 0 && (flags & FD_CLOEXEC) == 0) found.insert(name);
  }
  return found;
}

/// While it lives the process gets no further descriptor; those it has stay good.
class NoDescriptorsLeft {
 public:
  NoDescriptorsLeft() {
    getrlimit(RLIMIT_NOFILE, &before_);
    const rlimit none = {0, before_.rlim_max};
    setrlimit(RLIMIT_NOFILE, &none);
  }
  ~NoDescriptorsLeft() { setrlimit(RLIMIT_NOFILE, &before_); }
  NoDescriptorsLeft(const NoDescriptorsLeft&) = delete;
  NoDescriptorsLeft& operator=(const NoDescriptorsLeft&) = delete;

 private:
  rlimit before_ = {};
};

}  // namespace vexa_test
