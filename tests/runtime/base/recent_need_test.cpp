#include "runtime/base/recent_need.h"

#include <gtest/gtest.h>

namespace vexa {
namespace {

/// What the last of `uses` uses returns; those before must return none.
std::optional<std::size_t> after(RecentNeed& need, unsigned uses, std::size_t bytes) {
  for (unsigned i = 1; i < uses; ++i) EXPECT_EQ(need.used(bytes), std::nullopt) << i;
  return need.used(bytes);
}

TEST(RecentNeed, ShrinksAtTheEndOfAPeriodThatNeededLess) {
  RecentNeed need;
  EXPECT_EQ(after(need, RecentNeed::kPeriod, 1000000), std::nullopt);
  EXPECT_EQ(after(need, RecentNeed::kPeriod, 20000), 20000u);
  EXPECT_EQ(after(need, RecentNeed::kPeriod, 20000), std::nullopt) << "the rest is gone already";
}

TEST(RecentNeed, KeepsWhatOnePictureOfAPeriodNeeds) {
  RecentNeed need;
  EXPECT_EQ(need.used(1000000), std::nullopt);
  EXPECT_EQ(after(need, RecentNeed::kPeriod - 1, 20000), std::nullopt);
  EXPECT_EQ(after(need, RecentNeed::kPeriod, 20000), 20000u);
}

TEST(RecentNeed, KeepsLessThanTwiceTheNeedAndALittle) {
  const std::size_t limit = 2 * 100000 + RecentNeed::kLittle;
  for (const std::size_t touched : {limit - 1, limit}) {
    RecentNeed need;
    EXPECT_EQ(after(need, RecentNeed::kPeriod, touched), std::nullopt);
    const auto shrunk = after(need, RecentNeed::kPeriod, 100000);
    EXPECT_EQ(shrunk.has_value(), touched == limit) << touched;
  }
}

}  // namespace
}  // namespace vexa
