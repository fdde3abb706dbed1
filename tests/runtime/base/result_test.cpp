// SPDX-License-Identifier: Apache-2.0
#include "runtime/base/result.h"

#include <gtest/gtest.h>

#include <memory>

namespace vexa {
namespace {

constexpr KnownFailure kRefused{LIBD_UNAUTHORIZED, "a refusal whose text is longer than a text holds by itself"};

Result<int> half_of(int number) {
  if (number % 2 != 0) return kRefused;
  return number / 2;
}

TEST(Result, HoldsItsValue) {
  const Result<int> result = half_of(8);
  ASSERT_TRUE(result);
  EXPECT_EQ(*result, 4);
}

TEST(Result, HoldsItsFailureWithATextOfItsOwn) {
  const Result<int> result = half_of(7);
  ASSERT_FALSE(result);
  EXPECT_EQ(result.failure().code, LIBD_UNAUTHORIZED);
  EXPECT_EQ(result.failure().text, kRefused.text);
  EXPECT_NE(static_cast<const void*>(result.failure().text.c_str()), static_cast<const void*>(kRefused.text));
}

TEST(Result, HandsOverAValueThatCannotBeCopied) {
  Result<std::unique_ptr<int>> result = std::make_unique<int>(5);
  ASSERT_TRUE(result);
  const std::unique_ptr<int> taken = std::move(*result);
  EXPECT_EQ(*taken, 5);
}

TEST(Result, WithoutAValueIsSuccessUnlessItHoldsAFailure) {
  EXPECT_TRUE(Result<>());
  const Result<> failed = kRefused;
  ASSERT_FALSE(failed);
  EXPECT_EQ(failed.failure().text, kRefused.text);
}

TEST(WithinMemory, ReportsAnAllocationThatFails) {
  bool done = false;
  EXPECT_TRUE(within_memory([&] { done = true; }));
  EXPECT_TRUE(done);
  EXPECT_FALSE(within_memory([] { throw std::bad_alloc(); }));
}

TEST(WithinMemory, UndoesWhatWasMade) {
  const auto shared = std::make_shared<int>(1);
  EXPECT_FALSE(within_memory([&] {
    const auto made = shared;
    EXPECT_EQ(shared.use_count(), 2);
    throw std::bad_alloc();
  }));
  EXPECT_EQ(shared.use_count(), 1);
}

}  // namespace
}  // namespace vexa
