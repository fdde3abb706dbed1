// SPDX-License-Identifier: Apache-2.0
#include "host/base/number_text.h"

#include <gtest/gtest.h>

namespace vexa::host {
namespace {

TEST(NumberText, IsTheWholeText) {
  const struct {
    const char* text;
    std::optional<int> number;
  } cases[] = {{"0", 0},
               {"-12", -12},
               {"2147483647", 2147483647},
               {"2147483648", std::nullopt},
               {"", std::nullopt},
               {"+1", std::nullopt},
               {" 1", std::nullopt},
               {"1 ", std::nullopt},
               {"1x", std::nullopt},
               {"0x1", std::nullopt}};
  for (const auto& row : cases) EXPECT_EQ(number_text(row.text), row.number) << row.text;
}

TEST(NumberText, IsWithinItsBounds) {
  EXPECT_EQ(number_text("1", 1, 60), 1);
  EXPECT_EQ(number_text("60", 1, 60), 60);
  EXPECT_EQ(number_text("0", 1, 60), std::nullopt);
  EXPECT_EQ(number_text("61", 1, 60), std::nullopt);
}

TEST(NumberText, MayBeAFraction) {
  EXPECT_EQ(number_text<double>("2.5"), 2.5);
  EXPECT_EQ(number_text<double>("2,5"), std::nullopt);
}

TEST(TakenNumber, LeavesWhatFollows) {
  std::string_view text = "12,x";
  EXPECT_EQ(take_number<int>(text), 12);
  EXPECT_EQ(text, ",x");
  EXPECT_EQ(take_number<int>(text), std::nullopt);
  EXPECT_EQ(text, ",x");
}

}  // namespace
}  // namespace vexa::host
