// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/model/login_guard.h"

#include <gtest/gtest.h>

namespace vexa::camera {
namespace {

using namespace std::chrono_literals;

constexpr LoginGuard::Time kNoon{std::chrono::hours(12)};

TEST(LoginGuard, LetsInWhoeverHasTheRightCredentials) {
  LoginGuard guard(5);
  EXPECT_TRUE(guard.lets_in(true, kNoon));
  EXPECT_FALSE(guard.lets_in(false, kNoon));
  EXPECT_TRUE(guard.lets_in(true, kNoon));
}

TEST(LoginGuard, LocksForThirtyMinutesAfterSoManyRefusalsInARow) {
  LoginGuard guard(3);
  for (int i = 0; i < 3; ++i) {
    EXPECT_FALSE(guard.is_locked(kNoon));
    EXPECT_FALSE(guard.lets_in(false, kNoon));
  }
  EXPECT_TRUE(guard.is_locked(kNoon));
  EXPECT_FALSE(guard.lets_in(true, kNoon + 30min - 1s));
  EXPECT_TRUE(guard.lets_in(true, kNoon + 30min));
}

TEST(LoginGuard, ARightLoginBeginsTheCountAnew) {
  LoginGuard guard(2);
  for (int i = 0; i < 10; ++i) {
    EXPECT_FALSE(guard.lets_in(false, kNoon));
    EXPECT_TRUE(guard.lets_in(true, kNoon));
  }
}

TEST(LoginGuard, WithoutANumberNothingLocks) {
  LoginGuard guard(0);
  for (int i = 0; i < 1000; ++i) EXPECT_FALSE(guard.lets_in(false, kNoon));
  EXPECT_TRUE(guard.lets_in(true, kNoon));
}

}  // namespace
}  // namespace vexa::camera
