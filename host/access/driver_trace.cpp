#include "host/access/driver_trace.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <unistd.h>

#include <string_view>
#include <utility>

#include "host/base/printable.h"

namespace vexa::host {
namespace {

// For reading only: writing to a standard output that was closed must still fail.
bool open_standard_descriptors() {
  int fd = open("/dev/null", O_RDONLY | O_CLOEXEC);
  while (fd >= 0 && fd <= STDERR_FILENO) fd = open("/dev/null", O_RDONLY | O_CLOEXEC);
  return fd >= 0 && close(fd) == 0;
}

bool point_standard_output_at(int fd) { return dup2(fd, STDOUT_FILENO) == STDOUT_FILENO; }

bool silence_standard_output() {
  const UniqueFd nowhere(open("/dev/null", O_WRONLY | O_CLOEXEC));
  return nowhere.valid() && point_standard_output_at(nowhere.get());
}

}  // namespace

UniqueFd take_standard_output() {
  if (!open_standard_descriptors()) return UniqueFd();
  UniqueFd results(fcntl(STDOUT_FILENO, F_DUPFD_CLOEXEC, STDERR_FILENO + 1));
  if (!results.valid() || !silence_standard_output()) return UniqueFd();
  return results;
}

std::function<void(const char*)> shown_trace(Terminal& terminal, Redactor redactor) {
  return [&terminal, redactor = std::move(redactor)](const char* text) {
    for (std::string_view rest = text;;) {
      const std::size_t end = rest.find('\n');
      std::string_view line = rest.substr(0, end);
      if (line.ends_with('\r')) line.remove_suffix(1);
      terminal.say(fmt::format("driver: {}", printable(redactor(line))));
      if (end == std::string_view::npos) return;
      rest.remove_prefix(end + 1);
    }
  };
}

}  // namespace vexa::host
