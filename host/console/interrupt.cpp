#include "host/console/interrupt.h"

#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

#include <array>
#include <atomic>
#include <cerrno>
#include <csignal>
#include <string_view>

#include "host/base/problem.h"

namespace vexa::host {
namespace {

constexpr std::array kSignals = {SIGINT, SIGTERM, SIGHUP};
constexpr std::string_view kFarewell = "\nvexactl: interrupted\n";

// What the handler touches: lock-free atomics, so that it may run at any instruction.
std::atomic<bool> orderly{false};
std::atomic<bool> raised{false};
std::atomic<int> wake_read{-1};
std::atomic<int> wake_write{-1};
std::atomic<void (*)()> act_too{nullptr};
static_assert(std::atomic<bool>::is_always_lock_free && std::atomic<int>::is_always_lock_free);

[[noreturn]] void end_at_once() {
  [[maybe_unused]] const ssize_t written = write(STDERR_FILENO, kFarewell.data(), kFarewell.size());
  _exit(static_cast<int>(ExitCode::kInterrupted));
}

void on_signal(int) {
  const int saved_errno = errno;
  const bool second = raised.exchange(true);
  if (!orderly || second) end_at_once();
  const char byte = 0;
  [[maybe_unused]] const ssize_t written = write(wake_write, &byte, 1);
  if (void (*const act)() = act_too) act();
  errno = saved_errno;
}

}  // namespace

bool Interrupt::install() {
  int ends[2];
  if (pipe2(ends, O_CLOEXEC | O_NONBLOCK) != 0) return false;
  wake_read = ends[0];
  wake_write = ends[1];
  struct sigaction action {};
  action.sa_handler = on_signal;
  action.sa_flags = SA_RESTART;
  for (const int signal : kSignals) {
    struct sigaction current {};
    // A signal that the parent has switched off stays off, as under nohup.
    if (sigaction(signal, nullptr, &current) == 0 && current.sa_handler == SIG_IGN) continue;
    if (sigaction(signal, &action, nullptr) != 0) return false;
  }
  return true;
}

void Interrupt::finish_orderly() { orderly = true; }

bool Interrupt::requested() { return raised; }

void Interrupt::also(void (*act)()) {
  act_too = act;
  if (raised) act();
}

void Interrupt::wait(std::chrono::milliseconds time) {
  // The byte stays in the pipe: after a signal no call waits any more.
  pollfd wake{wake_read, POLLIN, 0};
  poll(&wake, 1, static_cast<int>(time.count()));
}

}  // namespace vexa::host
