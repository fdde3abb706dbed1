// SPDX-License-Identifier: Apache-2.0
#include "runtime/base/scanned_number.h"

#include <gtest/gtest.h>

#include <climits>
#include <string>

namespace vexa {
namespace {

constexpr std::uint32_t kLargest = 4294967295U;

TEST(ScannedNumber, ReadsSpacesASignAndDigits) {
  const struct {
    const char* text;
    std::size_t width;
    std::uint32_t value;
    std::size_t length;
  } cases[] = {{"0", 9, 0, 1},     {"42", 9, 42, 2},     {"42x", 9, 42, 2}, {" \t\n\v\f\r7", 9, 7, 7},
               {"+5", 9, 5, 2},    {"-0", 9, 0, 2},      {"007", 9, 7, 3},  {"4294967294", 99, 4294967294U, 10},
               {"1234", 2, 12, 2}, {"  1234", 2, 12, 4}, {"+12", 2, 1, 2},  {"0x10", 9, 0, 1}};
  for (const auto& c : cases) {
    const auto number = scan_number(c.text, c.width);
    ASSERT_TRUE(number) << c.text;
    EXPECT_EQ(number->value, c.value) << c.text;
    EXPECT_EQ(number->length, c.length) << c.text;
  }
}

TEST(ScannedNumber, ReadsNothingWithoutADigit) {
  for (const char* text : {"", " ", "x", "+", "-", "+-1", "- 1", "--1", "."})
    EXPECT_FALSE(scan_number(text, 9)) << text;
}

TEST(ScannedNumber, ReadsNothingWhenTheWidthEndsAtTheSign) { EXPECT_FALSE(scan_number("+1", 1)); }

TEST(ScannedNumber, NumbersBeyond32BitsBecomeTheLargest) {
  for (const char* text : {"4294967295", "4294967296", "99999999999999999999999999"}) {
    EXPECT_EQ(scan_number(text, 99)->value, kLargest) << text;
  }
}

TEST(ScannedNumber, NegativeNumbersBecomeTheLargest) {
  for (const char* text : {"-1", "-00012", "-99999999999999"})
    EXPECT_EQ(scan_number(text, 99)->value, kLargest) << text;
}

TEST(ScannedNumber, ReadsNoFurtherThanTheView) {
  const std::string text = "1234";
  EXPECT_EQ(scan_number(std::string_view(text).substr(0, 2), 99)->value, 12U);
}

struct Pair {
  const char* text;
  int first;
  int second;
};

class NumberPair : public testing::TestWithParam<Pair> {};

TEST_P(NumberPair, ReadsTwoNumbersAsScanfDoes) {
  const auto pair = vexa::leading_pair(GetParam().text);
  ASSERT_TRUE(pair) << GetParam().text;
  EXPECT_EQ(pair->first, GetParam().first);
  EXPECT_EQ(pair->second, GetParam().second);
}

INSTANTIATE_TEST_SUITE_P(Texts, NumberPair,
                         testing::Values(Pair{"1280,720", 1280, 720}, Pair{"0,0", 0, 0}, Pair{"-1,-1", -1, -1},
                                         Pair{"+5,+6", 5, 6}, Pair{" 12,\t34", 12, 34}, Pair{"1280,1024x", 1280, 1024},
                                         Pair{"1280,720,60", 1280, 720}, Pair{"007,010", 7, 10},
                                         Pair{"2147483647,-2147483648", INT_MAX, INT_MIN},
                                         Pair{"2147483648,-2147483649", INT_MAX, INT_MIN},
                                         Pair{"99999999999999999999,-99999999999999999999", INT_MAX, INT_MIN}));

class NoNumberPair : public testing::TestWithParam<const char*> {};

TEST_P(NoNumberPair, IsNone) { EXPECT_FALSE(vexa::leading_pair(GetParam())) << GetParam(); }

INSTANTIATE_TEST_SUITE_P(Texts, NoNumberPair,
                         testing::Values("", ",", "1280", "1280,", ",720", "1280 ,720", "1280x720", "1280;720", "a,b",
                                         "1280,a", "a,720", "-,5", "5,-", "1280.0,720", "5,,6"));

TEST(NumberPair, EndsAtANul) { EXPECT_FALSE(vexa::leading_pair(std::string("12\0,34", 6))); }

}  // namespace
}  // namespace vexa
