// SPDX-License-Identifier: Apache-2.0
// Start routines, and watching the threads that run them.
#pragma once

#include <gtest/gtest.h>

#include <atomic>

#include "tests/support/process_state.h"
#include "vexa/runtime.h"

#include <memory>

namespace vexa_test {

struct CloseEvent {
  void operator()(typedHandle* h) const { CloseEventHandle(h); }
};
using Event = std::unique_ptr<typedHandle, CloseEvent>;

inline Event make_event() { return Event(CreateEvent(nullptr, 1, 0, nullptr)); }

using Routine = unsigned int (*)(void*);

inline typedHandle* start(Routine routine, void* argument = nullptr) {
  return _beginthreadex(nullptr, 0, routine, argument, 0, nullptr);
}

inline unsigned long exit_code(typedHandle* thread) {
  unsigned long code = 12345;
  EXPECT_EQ(GetExitCodeThread(thread, &code), 1);
  return code;
}

inline bool finishes(typedHandle* thread) {
  return eventually([thread] { return exit_code(thread) != STILL_ACTIVE; });
}

inline unsigned int return_argument(void* argument) { return *static_cast<unsigned int*>(argument); }

inline unsigned int return_nothing(void*) { return 0; }

inline unsigned int store_identifier(void* argument) {
  *static_cast<std::atomic<long>*>(argument) = kernel_thread_id();
  return 0;
}

// Ends once `release` is set.
struct Gate {
  std::atomic<long> entered{0};  // the thread behind it
  std::atomic<bool> release{false};
  std::atomic<bool> left{false};  // the thread's last touch
};

inline unsigned int wait_at_gate(void* argument) {
  auto* gate = static_cast<Gate*>(argument);
  gate->entered = vexa_test::kernel_thread_id();
  eventually([gate] { return gate->release.load(); });
  gate->left = true;
  return 42;
}

// Opens the gate and waits until its thread has ended.
inline bool goes_through(Gate& gate) {
  gate.release = true;
  return eventually([&gate] { return gate.left && !is_running(gate.entered); });
}

}  // namespace vexa_test
