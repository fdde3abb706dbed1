// SPDX-License-Identifier: Apache-2.0
// Tables of values and words.
#include "device/cgi/words.h"

#include <gtest/gtest.h>

#include <climits>
#include <cstdint>

namespace {

enum Colour : std::int32_t { kRed = 0, kBlue = 7 };

constexpr vexa::Word<Colour> kColours[] = {{kRed, "red"}, {kBlue, "blue"}};

TEST(Words, GiveTheWordOfEachValue) {
  EXPECT_STREQ(vexa::word_of(kColours, kRed), "red");
  EXPECT_STREQ(vexa::word_of(kColours, kBlue), "blue");
}

TEST(Words, HaveNoneForAnyOtherValue) {
  for (const int value : {-1, 1, 6, 8, INT_MAX, INT_MIN}) {
    EXPECT_EQ(vexa::word_of(kColours, static_cast<Colour>(value)), nullptr) << value;
  }
}

TEST(Words, GiveTheValueOfEachWord) {
  EXPECT_EQ(vexa::value_of(kColours, "red"), kRed);
  EXPECT_EQ(vexa::value_of(kColours, "blue"), kBlue);
}

TEST(Words, AreComparedWhole) {
  for (const char* word : {"", "re", "redd", "Red", " red", "red "}) {
    EXPECT_FALSE(vexa::value_of(kColours, word)) << word;
  }
}

}  // namespace
