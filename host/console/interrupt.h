// Ctrl-C, SIGTERM and SIGHUP.
#ifndef HOST_CONSOLE_INTERRUPT_H_
#define HOST_CONSOLE_INTERRUPT_H_

#include <chrono>

namespace vexa::host {

// The pause between two polls of a driver that has no data: short compared with a frame, long compared with a call.
inline constexpr std::chrono::milliseconds kPollPause{3};

// One for the process; every operation may be called from any thread after install().
//
// At first a signal ends the process at once with the exit code of an interruption: nothing is open yet that would need
// closing. After finish_orderly() the first signal only raises requested(), and the second ends the process.
class Interrupt {
 public:
  // False when the system refuses, with errno set.
  [[nodiscard]] static bool install();
  static void finish_orderly();
  [[nodiscard]] static bool requested();
  // Lets `act` run too when a signal is taken, in its handler, and at once when one has been taken. One for the
  // process.
  static void also(void (*act)());
  // Sleeps up to `time`, less when a signal comes.
  static void wait(std::chrono::milliseconds time);
};

}  // namespace vexa::host

#endif  // HOST_CONSOLE_INTERRUPT_H_
