// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>

#include "runtime/handle.h"
#include "tests/runtime/thread_routines.h"

namespace {

using std::chrono::milliseconds;
using vexa_test::eventually;
using vexa_test::exit_code;
using vexa_test::Gate;
using vexa_test::is_sleeping;
using vexa_test::return_nothing;
using vexa_test::start;
using vexa_test::wait_at_gate;

constexpr milliseconds kForEver = std::chrono::hours(1);

/// A gate that is opened once `waiter` waits.
struct Opening {
  Gate gate;
  std::atomic<long> waiter{0};
};

unsigned int open_gate(void* argument) {
  auto* opening = static_cast<Opening*>(argument);
  EXPECT_TRUE(eventually([opening] { return opening->waiter != 0 && is_sleeping(opening->waiter); }));
  opening->gate.release = true;
  return 0;
}

TEST(WaitForThreadEnd, EndsWhenTheRoutineIsDone) {
  Opening opening;
  typedHandle* thread = start(wait_at_gate, &opening.gate);
  ASSERT_TRUE(eventually([&] { return opening.gate.entered != 0; }));
  typedHandle* opener = start(open_gate, &opening);
  const auto begin = std::chrono::steady_clock::now();
  opening.waiter = vexa_test::kernel_thread_id();
  vexa::wait_for_thread_end(thread, std::chrono::seconds(30));
  EXPECT_LT(std::chrono::steady_clock::now() - begin, std::chrono::seconds(25));
  EXPECT_EQ(exit_code(thread), 42U);
  EXPECT_TRUE(vexa_test::finishes(opener));  // before what it looks at has gone
  EXPECT_EQ(CloseHandle(thread), 1);
  EXPECT_EQ(CloseHandle(opener), 1);
}

TEST(WaitForThreadEnd, LastsNoLongerThanItMay) {
  Gate gate;
  typedHandle* thread = start(wait_at_gate, &gate);
  vexa::wait_for_thread_end(thread, milliseconds(1));
  EXPECT_EQ(exit_code(thread), STILL_ACTIVE);
  gate.release = true;
  ASSERT_TRUE(vexa_test::finishes(thread));  // a thread that is let go would still look at the gate
  EXPECT_EQ(CloseHandle(thread), 1);
}

TEST(WaitForThreadEnd, LastsItsWholeTimeWhenTheRoutineWasDoneBefore) {
  typedHandle* thread = start(return_nothing);
  ASSERT_TRUE(vexa_test::finishes(thread));
  const auto begin = std::chrono::steady_clock::now();
  vexa::wait_for_thread_end(thread, milliseconds(5));
  EXPECT_GE(std::chrono::steady_clock::now() - begin, milliseconds(5));
  EXPECT_EQ(CloseHandle(thread), 1);
}

TEST(WaitForThreadEnd, OfNoThreadIsOverAtOnce) { vexa::wait_for_thread_end(nullptr, kForEver); }

}  // namespace
