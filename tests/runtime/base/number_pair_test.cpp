// Two numbers with a comma between them.
#include "runtime/base/number_pair.h"

#include <gtest/gtest.h>

#include <climits>
#include <string>

namespace {

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
