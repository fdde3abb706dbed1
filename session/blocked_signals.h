// SPDX-License-Identifier: Apache-2.0
// Signals belong to the host.
#pragma once

#include <csignal>

namespace vexa {

/// While it exists the calling thread takes no signals, nor do threads that it makes: those never do.
class BlockedSignals {
 public:
  BlockedSignals() {
    sigset_t all;
    sigfillset(&all);
    pthread_sigmask(SIG_SETMASK, &all, &before_);
  }
  ~BlockedSignals() { pthread_sigmask(SIG_SETMASK, &before_, nullptr); }
  BlockedSignals(const BlockedSignals&) = delete;
  BlockedSignals& operator=(const BlockedSignals&) = delete;

 private:
  sigset_t before_{};
};

}  // namespace vexa
