#include "host/access/driver_trace.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdio>
#include <string>

#include "host/base/printable.h"

namespace vexa::host {
namespace {

// The driver's requests are at most this long; a longer line is shown in pieces.
constexpr std::size_t kLongestLine = 4096;

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

std::unique_ptr<DriverTrace> DriverTrace::start(Terminal& terminal, Redactor redactor) {
  int ends[2];
  if (pipe2(ends, O_CLOEXEC) != 0) return nullptr;
  UniqueFd lines(ends[0]);
  const UniqueFd entry(ends[1]);
  if (!point_standard_output_at(entry.get())) return nullptr;
  // Lines appear when they are printed, not when a block is full.
  if (std::setvbuf(stdout, nullptr, _IOLBF, BUFSIZ) != 0) return nullptr;
  return std::unique_ptr<DriverTrace>(new DriverTrace(std::move(lines), terminal, std::move(redactor)));
}

DriverTrace::DriverTrace(UniqueFd lines, Terminal& terminal, Redactor redactor)
    : lines_(std::move(lines)),
      terminal_(terminal),
      redactor_(std::move(redactor)),
      thread_([this] { show_lines(); }) {}

DriverTrace::~DriverTrace() {
  std::fflush(stdout);
  silence_standard_output();  // closes the pipe's last entry, which ends the thread
  thread_.join();
}

void DriverTrace::show_lines() {
  std::string pending;
  const auto show = [&](std::size_t length) {
    std::string_view line(pending.data(), length);
    if (line.ends_with('\r')) line.remove_suffix(1);
    terminal_.say(fmt::format("driver: {}", printable(redactor_(line))));
  };
  std::array<char, 1024> piece{};
  for (;;) {
    const ssize_t count = read(lines_.get(), piece.data(), piece.size());
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) break;
    pending.append(piece.data(), static_cast<std::size_t>(count));
    for (std::size_t end = pending.find('\n'); end != std::string::npos; end = pending.find('\n')) {
      show(end);
      pending.erase(0, end + 1);
    }
    if (pending.size() > kLongestLine) {
      show(pending.size());
      pending.clear();
    }
  }
  if (!pending.empty()) show(pending.size());
}

}  // namespace vexa::host
