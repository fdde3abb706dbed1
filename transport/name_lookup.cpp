// SPDX-License-Identifier: Apache-2.0
#include "transport/name_lookup.h"

#include <arpa/inet.h>
#include <dlfcn.h>
#include <netdb.h>
#include <pthread.h>

#include <atomic>
#include <chrono>
#include <csignal>
#include <cstdint>
#include <cstring>
#include <memory>
#include <utility>

namespace vexa {
namespace {

constexpr std::size_t kStackSize = std::size_t{512} * 1024;
constexpr int kPlacePause = 20;    // milliseconds between two tries for a place
constexpr int kLookInterval = 50;  // milliseconds, at a lookup whose end could not be signalled

std::atomic<int> running{0};

struct Lookup {
  Lookup(std::string name, int to) : host(std::move(name)), port(to) {}

  const std::string host;
  const int port;
  ResolvedHost found;  // the thread's until it has ended
  std::atomic<bool> ended{false};
  CancelSignal done;
};

using Shared = std::shared_ptr<Lookup>;

void* run_lookup(void* argument) {
  const std::unique_ptr<Shared> lookup(static_cast<Shared*>(argument));
  (*lookup)->found = look_up((*lookup)->host, (*lookup)->port);
  (*lookup)->ended = true;
  (*lookup)->done.raise();
  --running;
  return nullptr;
}

/// False when the wait for a place is cancelled.
bool take_place(Cancels cancels) {
  while (++running > kMostLookups) {
    --running;
    if (cancels.raised()) return false;
    WaitBudget({kPlacePause, cancels}).pause();
  }
  return true;
}

/// Begins with every signal blocked, so that a host's handlers run in threads of the host.
bool begin_thread(pthread_t& thread, Shared* lookup) {
  pthread_attr_t attributes;
  if (pthread_attr_init(&attributes) != 0) return false;
  pthread_attr_setstacksize(&attributes, kStackSize);
  sigset_t all;
  sigset_t before;
  sigfillset(&all);
  pthread_sigmask(SIG_SETMASK, &all, &before);
  const bool begun = pthread_create(&thread, &attributes, run_lookup, lookup) == 0;
  pthread_sigmask(SIG_SETMASK, &before, nullptr);
  pthread_attr_destroy(&attributes);
  return begun;
}

/// False when the wait is cancelled.
bool wait_for_end(const Lookup& lookup, Cancels cancels) {
  for (;;) {
    const auto begun = std::chrono::steady_clock::now();
    if (WaitBudget({kLookInterval, cancels}).wait_readable(lookup.done.descriptor()) != 0) return lookup.ended;
    // Safe: a system that refuses the write of the signal does not keep the caller waiting for ever.
    if (lookup.ended) return true;
    // A wait that is cancelled ends early: this one or, at once, the next.
    if (std::chrono::steady_clock::now() - begun < std::chrono::milliseconds(kLookInterval / 2)) return false;
  }
}

/// Safe: a thread that nobody joins still has this library's code to run when the host unloads the library; so it stays
/// loaded from then on.
void stay_loaded() {
  Dl_info here{};
  if (dladdr(reinterpret_cast<void*>(&stay_loaded), &here) == 0 || here.dli_fname == nullptr) return;
  dlopen(here.dli_fname, RTLD_LAZY | RTLD_NOLOAD | RTLD_NODELETE);
}

}  // namespace

ResolvedHost look_up(const std::string& host, int port) {
  hostent entry{};
  hostent* found = nullptr;
  char work[1024];
  ResolvedHost resolved;
  const int result = gethostbyname_r(host.c_str(), &entry, work, sizeof work, &found, &resolved.error);
  if (result != 0 || found == nullptr || found->h_addr_list[0] == nullptr) return resolved;
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_port = htons(static_cast<std::uint16_t>(port));
  std::memcpy(&address.sin_addr, found->h_addr_list[0], sizeof address.sin_addr);
  resolved.address = address;
  return resolved;
}

ResolvedHost look_up_beside(const std::string& host, int port, Cancels cancels) {
  const ResolvedHost given_up{std::nullopt, TRY_AGAIN};
  const auto lookup = std::make_shared<Lookup>(host, port);
  auto for_thread = std::make_unique<Shared>(lookup);
  if (lookup->done.descriptor() < 0) return look_up(host, port);
  if (cancels.raised() || !take_place(cancels)) return given_up;
  pthread_t thread{};
  if (!begin_thread(thread, for_thread.get())) {
    --running;
    return look_up(host, port);
  }
  static_cast<void>(for_thread.release());  // the thread's
  if (wait_for_end(*lookup, cancels)) {
    pthread_join(thread, nullptr);
    return lookup->found;
  }
  stay_loaded();
  pthread_detach(thread);
  return given_up;
}

}  // namespace vexa
