#include "runtime/base/scanned_number.h"

#include <gtest/gtest.h>

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

}  // namespace
}  // namespace vexa
