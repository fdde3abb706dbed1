// SPDX-License-Identifier: Apache-2.0
// Signals without end for one thread, so that its waits are interrupted again and again.
#pragma once

#include <pthread.h>
#include <signal.h>

#include <atomic>
#include <chrono>
#include <thread>

#include "tests/support/process_state.h"

namespace vexa_test {

/// While it lives, the thread that made it gets SIGUSR1 every millisecond, without SA_RESTART.
class Interruptions {
 public:
  Interruptions() : target_(pthread_self()) {
    taken().store(0);
    struct sigaction action {};
    action.sa_handler = [](int) { taken().fetch_add(1); };
    sigaction(SIGUSR1, &action, &before_);
    thread_ = std::thread([this] {
      while (!done_) {
        pthread_kill(target_, SIGUSR1);
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
      }
    });
  }
  ~Interruptions() {
    done_ = true;
    thread_.join();
    sigaction(SIGUSR1, &before_, nullptr);
  }
  Interruptions(const Interruptions&) = delete;
  Interruptions& operator=(const Interruptions&) = delete;

  /// Does `work` until a signal has come during it; false when none does. The machine may be too busy to send one each
  /// millisecond.
  template <typename Work>
  bool come_during(Work work) const {
    return eventually([&work] {
      const int before = taken();
      work();
      return taken() > before;
    });
  }

 private:
  static std::atomic<int>& taken() {
    static std::atomic<int> taken{0};
    return taken;
  }

  pthread_t target_;
  struct sigaction before_ {};
  std::atomic<bool> done_{false};
  std::thread thread_;
};

}  // namespace vexa_test
