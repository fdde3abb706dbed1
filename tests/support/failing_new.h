// SPDX-License-Identifier: Apache-2.0
// Lets allocations fail, and counts them. A test program that uses it has its operator new replaced.
#pragma once

#include <gtest/gtest.h>

#include <string>
#include <type_traits>

#include "vexa/return_codes.h"

namespace vexa_test {

/// While it lives, the calling thread's allocation number `nth`, counted from 0, fails once.
class AllocationFailure {
 public:
  explicit AllocationFailure(int nth);
  ~AllocationFailure();
  AllocationFailure(const AllocationFailure&) = delete;
  AllocationFailure& operator=(const AllocationFailure&) = delete;

  /// Whether the failure has come.
  bool happened() const;
};

/// Counts the calling thread's allocations from its making on.
class AllocationCount {
 public:
  AllocationCount();
  int so_far() const;

 private:
  const int before_;
};

/// One attempt of fails_at_every_allocation.
class Shortage {
 public:
  explicit Shortage(int nth) : nth_(nth) {}

  /// What `call` returns, if it returns anything, while its allocation number nth() fails.
  template <typename Call>
  auto run(Call call) {
    const AllocationFailure failure(nth_);
    if constexpr (std::is_void_v<decltype(call())>) {
      call();
      failed_ = failure.happened();
    } else {
      auto result = call();
      failed_ = failure.happened();
      return result;
    }
  }

  int nth() const { return nth_; }
  /// Whether there was such an allocation.
  bool failed() const { return failed_; }

 private:
  const int nth_;
  bool failed_ = false;
};

/// Makes attempts until one goes through: each sets up what it needs, runs the call in question by Shortage::run and
/// checks what came of it. The call allocates more than `few` times. @return how often.
template <typename Attempt>
int fails_at_every_allocation(Attempt attempt, int few = 0) {
  for (int nth = 0; nth < 2000; ++nth) {
    SCOPED_TRACE("allocation " + std::to_string(nth));
    Shortage shortage(nth);
    attempt(shortage);
    if (testing::Test::HasFatalFailure()) return nth;
    if (shortage.failed()) continue;
    EXPECT_GT(nth, few);
    return nth;
  }
  ADD_FAILURE() << "no attempt goes through";
  return 2000;
}

/// Runs `call`, which fails and records why when an allocation does, and succeeds otherwise.
template <typename Driver, typename Call>
void expect_failure_told(Shortage& shortage, Driver& driver, Call call) {
  const auto code = shortage.run(call);
  EXPECT_EQ(code, shortage.failed() ? LIBD_FAILED : LIBD_OK);
  if (!shortage.failed()) return;
  std::string text;
  driver.GetLatestErrorText(text);
  EXPECT_EQ(text, "Cannot allocate memory");
}

}  // namespace vexa_test
