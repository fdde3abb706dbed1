// SPDX-License-Identifier: Apache-2.0
// The camera's words of exposure and image control, and the steps along exposure lists.
#include "device/cgi/image_text.h"

#include <gtest/gtest.h>

#include <climits>
#include <string>

namespace {

template <typename Value>
struct Row {
  int number;
  const char* word;
};

template <typename Value, std::size_t kRows, std::size_t kExpected>
void expect_table(const vexa::Word<Value> (&table)[kRows], const Row<Value> (&rows)[kExpected]) {
  static_assert(kRows == kExpected);
  for (const Row<Value>& row : rows) {
    EXPECT_STREQ(vexa::word_of(table, static_cast<Value>(row.number)), row.word);
    EXPECT_EQ(vexa::value_of(table, row.word), static_cast<Value>(row.number)) << row.word;
  }
}

TEST(ImageWords, OfNoiseReduction) {
  expect_table<ELibDXdnrType>(vexa::kXdnrWords, {{0, "high"}, {1, "mid"}, {2, "low"}, {3, "off"}});
}

TEST(ImageWords, OfTheVisibilityEnhancer) {
  expect_table<ELibDVisibilityEnhancerType>(vexa::kVisibilityWords, {{0, "high"}, {1, "mid"}, {2, "low"}, {3, "off"}});
}

TEST(ImageWords, OfTheDynamicRange) { expect_table<ELibDViewDRMode>(vexa::kViewDrWords, {{0, "off"}, {1, "on"}}); }

TEST(ImageWords, OfTheIlluminator) {
  expect_table<ELibIRIlluminatorMode>(vexa::kIlluminatorWords, {{0, "off"}, {1, "daynight"}});
}

TEST(ImageWords, OfTheVideoOutput) {
  expect_table<ELibVideoOutMode>(vexa::kVideoOutWords, {{0, "ip"}, {1, "pal"}, {2, "ntsc"}});
}

TEST(ImageWords, OfDayAndNight) {
  expect_table<ELibDDayNightType>(vexa::kDayNightRequests,
                                  {{10, "auto"}, {20, "manual&DayNight=off"}, {30, "manual&DayNight=on"}});
}

struct DayNightRow {
  const char* answer;
  int mode;
};

class DayNight : public testing::TestWithParam<DayNightRow> {};

TEST_P(DayNight, IsReadFromTheModeAndThenTheState) {
  const auto mode = vexa::day_night_of(GetParam().answer);
  ASSERT_TRUE(mode);
  EXPECT_EQ(*mode, GetParam().mode);
}

INSTANTIATE_TEST_SUITE_P(Known, DayNight,
                         testing::Values(DayNightRow{"A=1&DayNightMode=auto", 10},
                                         DayNightRow{"A=1&DayNightMode=auto&DayNight=on", 10},
                                         DayNightRow{"A=1&DayNightMode=manual&DayNight=off", 20},
                                         DayNightRow{"A=1&DayNightMode=manual&DayNight=on", 30},
                                         DayNightRow{"A=1&DayNight=on&B=2&DayNightMode=manual", 30},
                                         DayNightRow{"A=1&DayNightMode=manual&DayNight=on&DayNight=off", 30},
                                         DayNightRow{"A=1&DayNightMode=auto&DayNightMode=manual&DayNight=on", 10}));

INSTANTIATE_TEST_SUITE_P(Unknown, DayNight,
                         testing::Values(DayNightRow{"A=1&DayNightMode=", -1}, DayNightRow{"A=1&DayNightMode=Auto", -1},
                                         DayNightRow{"A=1&DayNightMode=night&DayNight=on", -1},
                                         DayNightRow{"A=1&DayNightMode=manual", -1},
                                         DayNightRow{"A=1&DayNightMode=manual&DayNight=", -1},
                                         DayNightRow{"A=1&DayNightMode=manual&DayNight=ON", -1},
                                         DayNightRow{"A=1&DayNightMode=manual&xDayNight=on", -1}));

TEST(DayNight, IsNoneWithoutItsKey) {
  for (const char* answer : {"", "A=1", "DayNightMode=auto", "A=1&DayNight=on", "A=1&DayNightMode"}) {
    EXPECT_FALSE(vexa::day_night_of(answer)) << answer;
  }
}

TEST(ExposureMode, HasAWordForEachOfTheThree) {
  EXPECT_STREQ(vexa::exposure_word_of("Full auto"), "full");
  EXPECT_STREQ(vexa::exposure_word_of("Shutter Priority"), "shutter");
  EXPECT_STREQ(vexa::exposure_word_of("Iris Priority"), "iris");
  for (const char* mode : {"", "full", "Full Auto", "Shutter Priority ", "Manual"}) {
    EXPECT_EQ(vexa::exposure_word_of(mode), nullptr) << mode;
  }
}

TEST(ExposureMode, LeavesAControlToTheHostInTwoOfThem) {
  EXPECT_EQ(vexa::exposure_control_of("Shutter Priority"), vexa::ExposureControl::kShutter);
  EXPECT_EQ(vexa::exposure_control_of("Iris Priority"), vexa::ExposureControl::kIris);
  for (const char* mode : {"", "Full auto", "iris", "Manual"}) EXPECT_FALSE(vexa::exposure_control_of(mode)) << mode;
}

TEST(ExposureEntry, IsTheFirstOfItsName) {
  vexa::ExposureModes modes(3);
  modes[0].name = "Full auto";
  modes[1].name = modes[2].name = "Iris Priority";
  EXPECT_EQ(vexa::exposure_entry(modes, "Iris Priority"), 1);
  EXPECT_EQ(vexa::exposure_entry(modes, "Full auto"), 0);
  EXPECT_EQ(vexa::exposure_entry(modes, "Shutter Priority"), -1);
  EXPECT_EQ(vexa::exposure_entry({}, "Full auto"), -1);
}

struct ExposureRow {
  int level;
  int largest;
  int value;
};

class ExposureValue : public testing::TestWithParam<ExposureRow> {};

TEST_P(ExposureValue, IsTheLevelsShareOfTheLargest) {
  EXPECT_EQ(vexa::exposure_value(GetParam().level, GetParam().largest), GetParam().value);
}

INSTANTIATE_TEST_SUITE_P(Rounding, ExposureValue,
                         testing::Values(ExposureRow{5000, 33, 17}, ExposureRow{0, 33, 0}, ExposureRow{10000, 33, 33},
                                         ExposureRow{1, 33, 0}, ExposureRow{9999, 33, 33}, ExposureRow{5000, 1, 1},
                                         ExposureRow{4999, 1, 0}, ExposureRow{1499, 10, 1}, ExposureRow{1500, 10, 2},
                                         ExposureRow{3333, 3, 1}, ExposureRow{10000, 10000, 10000}));

INSTANTIATE_TEST_SUITE_P(Limits, ExposureValue,
                         testing::Values(ExposureRow{10000, 10001, 10000}, ExposureRow{10000, INT_MAX, 10000},
                                         ExposureRow{1, INT_MAX, 10000}, ExposureRow{10000, 0, 0},
                                         ExposureRow{10000, -5, 0}, ExposureRow{10000, INT_MIN, 0},
                                         ExposureRow{-1, 33, 0}, ExposureRow{10001, 33, 33},
                                         ExposureRow{INT_MAX, 33, 33}, ExposureRow{INT_MIN, 33, 0}));

TEST(ExposureStep, TakesTheNeighbourWhateverItsSize) {
  const vexa::ExposureSteps steps{{"1/50", 4}, {"1/100", 9}, {"1/250", 11}};
  for (const int step : {1, 2, 10000}) {
    EXPECT_EQ(vexa::next_exposure_value(steps, 4, step), 9);
    EXPECT_EQ(vexa::next_exposure_value(steps, 9, step), 11);
    EXPECT_EQ(vexa::next_exposure_value(steps, 11, -step), 9);
    EXPECT_EQ(vexa::next_exposure_value(steps, 9, -step), 4);
  }
}

TEST(ExposureStep, IsNoneAtTheEndsAndForValuesOutsideTheList) {
  const vexa::ExposureSteps steps{{"1/50", 4}, {"1/100", 9}, {"1/250", 11}};
  EXPECT_FALSE(vexa::next_exposure_value(steps, 11, 1));
  EXPECT_FALSE(vexa::next_exposure_value(steps, 4, -1));
  for (const int current : {-1, 0, 5, 10, 12}) {
    EXPECT_FALSE(vexa::next_exposure_value(steps, current, 1)) << current;
    EXPECT_FALSE(vexa::next_exposure_value(steps, current, -1)) << current;
  }
  EXPECT_FALSE(vexa::next_exposure_value({}, 4, 1));
  EXPECT_FALSE(vexa::next_exposure_value({}, 4, -1));
  EXPECT_FALSE(vexa::next_exposure_value({{"1/50", 4}}, 4, 1));
  EXPECT_FALSE(vexa::next_exposure_value({{"1/50", 4}}, 4, -1));
}

TEST(ExposureStep, StartsFromTheFirstOfEqualValuesUpAndFromTheLastDown) {
  const vexa::ExposureSteps steps{{"a", 4}, {"b", 7}, {"c", 4}, {"d", 8}};
  EXPECT_EQ(vexa::next_exposure_value(steps, 4, 1), 7);
  EXPECT_EQ(vexa::next_exposure_value(steps, 4, -1), 7);
  const vexa::ExposureSteps ends{{"a", 4}, {"b", 7}, {"c", 4}};
  EXPECT_EQ(vexa::next_exposure_value(ends, 4, 1), 7);
  EXPECT_EQ(vexa::next_exposure_value(ends, 4, -1), 7);
}

}  // namespace
