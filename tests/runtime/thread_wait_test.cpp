// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <chrono>

#include "runtime/handle.h"
#include "tests/runtime/thread_routines.h"

namespace {

using std::chrono::milliseconds;
using vexa_test::exit_code;
using vexa_test::Gate;
using vexa_test::return_nothing;
using vexa_test::start;
using vexa_test::wait_at_gate;

constexpr milliseconds kForEver = std::chrono::hours(1);

unsigned int open_gate(void* gate) {
  static_cast<Gate*>(gate)->release = true;
  return 0;
}

TEST(WaitForThreadEnd, EndsWhenTheRoutineIsDone) {
  Gate gate;
  typedHandle* thread = start(wait_at_gate, &gate);
  typedHandle* opener = start(open_gate, &gate);
  // Done before the first look, it is not waited for.
  while (exit_code(thread) == STILL_ACTIVE) vexa::wait_for_thread_end(thread, milliseconds(100));
  EXPECT_EQ(exit_code(thread), 42U);
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
