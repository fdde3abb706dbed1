// SPDX-License-Identifier: Apache-2.0
#include "runtime/base/text.h"

#include <gtest/gtest.h>

#include <climits>

namespace vexa {
namespace {

TEST(TextAfter, GivesWhatFollowsTheFirstKey) {
  EXPECT_EQ(text_after("a=1&a=2", "a="), "1&a=2");
  EXPECT_EQ(text_after("key", "key"), "");
  EXPECT_EQ(text_after("ke", "key"), std::nullopt);
  EXPECT_EQ(text_after("", "key"), std::nullopt);
  EXPECT_EQ(text_after("abc", ""), "abc");
}

TEST(TextBefore, GivesWhatComesBeforeTheFirstMark) {
  EXPECT_EQ(text_before("a&b&c", '&'), "a");
  EXPECT_EQ(text_before("&b", '&'), "");
  EXPECT_EQ(text_before("abc", '&'), "abc");
  EXPECT_EQ(before_nul(std::string_view("ab\0cd", 5)), "ab");
}

TEST(LeadingInt, ReadsAsStrtolDoes) {
  const struct {
    const char* text;
    int value;
  } cases[] = {{"0", 0},
               {"12", 12},
               {" \t\n7", 7},
               {"+5", 5},
               {"-5", -5},
               {"12ab", 12},
               {"ab", 0},
               {"", 0},
               {"- 5", 0},
               {"0x10", 0},
               {"1.9", 1},
               {"007", 7},
               {"--1", 0},
               {"2147483647", INT_MAX},
               {"2147483648", INT_MAX},
               {"99999999999999999999999", INT_MAX},
               {"-2147483648", INT_MIN},
               {"-2147483649", INT_MIN},
               {"-99999999999999999999999", INT_MIN}};
  for (const auto& c : cases) EXPECT_EQ(leading_int(c.text), c.value) << c.text;
}

TEST(ClampToInt, KeepsBothLimits) {
  EXPECT_EQ(clamp_to_int(INT_MAX), INT_MAX);
  EXPECT_EQ(clamp_to_int(INT_MAX + 1LL), INT_MAX);
  EXPECT_EQ(clamp_to_int(INT_MIN), INT_MIN);
  EXPECT_EQ(clamp_to_int(INT_MIN - 1LL), INT_MIN);
}

TEST(IsAsciiAlphanumeric, KnowsTheEdgesOfItsThreeRanges) {
  for (const char c : {'0', '9', 'A', 'Z', 'a', 'z'}) EXPECT_TRUE(is_ascii_alphanumeric(c)) << c;
  for (const char c : {'/', ':', '@', '[', '`', '{', '\0', '\xe4', '\xff'}) EXPECT_FALSE(is_ascii_alphanumeric(c));
}

TEST(Masked, HidesEachPlaceOfASecret) {
  const struct {
    const char* text;
    const char* secret;
    const char* shown;
  } cases[] = {{"no swordfish", "swordfish", "no ***"},
               {"swordfish, swordfishes", "swordfish", "***, ***es"},
               {"aaa", "aa", "***a"},
               {"a*a", "*", "a***a"},
               {"Swordfish", "swordfish", "Swordfish"},
               {"sword", "swordfish", "sword"},
               {"swordfish", "", "swordfish"},
               {"", "swordfish", ""}};
  for (const auto& c : cases) EXPECT_EQ(masked(c.text, c.secret), c.shown) << c.text << " " << c.secret;
}

TEST(FormatWithin, KeepsWhatFitsAndReportsWhetherItWasCut) {
  const Formatted fitting = format_within(4, "%s", "abc");
  EXPECT_EQ(fitting.text, "abc");
  EXPECT_FALSE(fitting.cut);
  const Formatted cut = format_within(4, "%s%d", "ab", 34);
  EXPECT_EQ(cut.text, "ab3");
  EXPECT_TRUE(cut.cut);
  const Formatted empty = format_within(1, "%s", "");
  EXPECT_EQ(empty.text, "");
  EXPECT_FALSE(empty.cut);
}

}  // namespace
}  // namespace vexa
