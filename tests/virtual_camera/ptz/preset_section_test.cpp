// SPDX-License-Identifier: Apache-2.0
// What a camera keeps of presets and tours, without a head that moves.
#include "virtual_camera/ptz/preset_section.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <optional>
#include <string>

#include "tests/virtual_camera/ptz/ptz_models.h"

namespace vexa::camera {
namespace {

using Pairs = PresetSection::Pairs;

// The value that the inquiry gives for a key; nullopt without one.
std::optional<std::string> value_of(const PresetSection& section, const std::string& key) {
  const Pairs pairs = section.answer();
  const auto found = std::find_if(pairs.begin(), pairs.end(), [&key](const auto& pair) { return pair.first == key; });
  return found == pairs.end() ? std::nullopt : std::optional(found->second);
}

TEST(PresetSection, AnswersWithWhatTheModelHasAsItLeavesTheFactory) {
  const Pairs expected = {{"PresetNum", "0"},        {"Tour", "off"},
                          {"TourResume", "off"},     {"TourA", "off"},
                          {"TourASequence", ""},     {"TourAStaytime", "10"},
                          {"TourAPeriod", "always"}, {"TourASpeed", "20"},
                          {"TourB", "off"},          {"TourBSequence", ""},
                          {"TourBStaytime", "10"},   {"TourBPeriod", "always"},
                          {"TourBSpeed", "20"},      {"STour", "off"},
                          {"STourResume", "off"},    {"STourMaxRecordTime", "60"},
                          {"STourA", "off"},         {"STourAPeriod", "always"},
                          {"STourB", "off"},         {"STourBPeriod", "always"}};
  EXPECT_EQ(PresetSection(dome()).answer(), expected);
}

TEST(PresetSection, OfAModelWithoutToursNamesThePresetsAlone) {
  PtzProfile profile = dome();
  profile.tours = profile.shadow_tours = 0;
  PresetSection section(profile);
  section.presets[3] = {"a,b&c%", {}};
  section.presets[1] = {"one", {}};
  const Pairs expected = {{"PresetNum", "2"}, {"PresetName", "1,one,3,a%2Cb%26c%25"}};
  EXPECT_EQ(section.answer(), expected);
  EXPECT_FALSE(section.set_tours({{"Tour", "on"}}));
  EXPECT_FALSE(section.set_tours({{"STour", "off"}}));
}

TEST(PresetSection, TakesValuesUpToTheirLimitsAndNoneBeyond) {
  const struct {
    const char* key;
    const char* value;
    bool taken;
  } rows[] = {{"Tour", "on", true},
              {"Tour", "On", false},
              {"Tour", "", false},
              {"TourResume", "on", true},
              {"TourRsmTime", "0", false},
              {"TourRsmTime", "1", true},
              {"TourRsmTime", "9999999", true},
              {"TourRsmTime", "10000000", false},
              {"TourAStaytime", "0", false},
              {"TourAStaytime", "1", true},
              {"TourAStaytime", "9999999", true},
              {"TourAStaytime", "10000000", false},
              {"TourASpeed", "0", false},
              {"TourASpeed", "20", true},
              {"TourASpeed", "21", false},
              {"TourASequence", "1,16", true},
              {"TourASequence", "1,17", false},
              {"TourASequence", "0,1", false},
              {"TourASequence", "1", false},
              {"TourASequence", "1,", false},
              {"TourAPeriod", "always", true},
              {"TourAPeriod", "never", false},
              {"TourAColour", "red", false},
              {"TourB", "on", true},
              {"TourC", "on", false},
              {"TourC", "off", false},
              {"Toura", "on", false},
              {"STourB", "on", true},
              {"STourC", "off", true},
              {"STourC", "on", false},
              {"STourF", "off", false},
              {"STourAPeriod", "always", true},
              {"STourAPeriod", "daily", false},
              {"Preset", "on", false}};
  for (const auto& row : rows) {
    PresetSection section(dome());
    EXPECT_EQ(section.set_tours({{row.key, row.value}}), row.taken) << row.key << "=" << row.value;
  }
}

TEST(PresetSection, TakesAllSettingsOfACommandOrNone) {
  PresetSection section(dome());
  const Pairs before = section.answer();
  EXPECT_FALSE(section.set_tours({}));
  EXPECT_FALSE(section.set_tours({{"TourAStaytime", "5"}, {"TourASpeed", "0"}}));
  EXPECT_FALSE(section.set_tours({{"TourA", "on"}, {"TourB", "on"}})) << "two tours of a kind";
  EXPECT_FALSE(section.set_tours({{"STourA", "on"}, {"STourB", "on"}})) << "two tours of a kind";
  EXPECT_EQ(section.answer(), before);
}

TEST(PresetSection, ResumingIsThirtySecondsUnlessATimeIsSet) {
  PresetSection section(dome());
  EXPECT_EQ(value_of(section, "TourRsmTime"), std::nullopt);
  ASSERT_TRUE(section.set_tours({{"TourResume", "on"}}));
  EXPECT_EQ(value_of(section, "TourRsmTime"), "30");
  ASSERT_TRUE(section.set_tours({{"TourRsmTime", "7"}, {"TourResume", "on"}}));
  EXPECT_EQ(value_of(section, "TourRsmTime"), "7");
  ASSERT_TRUE(section.set_tours({{"TourResume", "off"}}));
  EXPECT_EQ(value_of(section, "TourResume"), "off");
  EXPECT_EQ(value_of(section, "TourRsmTime"), std::nullopt);
  EXPECT_EQ(value_of(section, "STourResume"), "off") << "the other kind has its own";
}

TEST(PresetSection, TheTourThatRunsIsTheOneSwitchedOnOfTheKindSwitchedOnLast) {
  PresetSection section(dome());
  ASSERT_TRUE(section.set_tours({{"TourB", "on"}, {"STourA", "on"}}));
  EXPECT_EQ(section.camera_tour(), nullptr) << "its kind is off";
  EXPECT_EQ(section.shadow_tour(), nullptr) << "its kind is off";
  ASSERT_TRUE(section.set_tours({{"Tour", "on"}}));
  EXPECT_EQ(section.camera_tour(), &section.camera_tours[1]);
  ASSERT_TRUE(section.set_tours({{"STour", "on"}}));
  EXPECT_EQ(section.camera_tour(), nullptr);
  EXPECT_EQ(section.shadow_tour(), &section.shadow_tours[0]);
  section.end_tours();
  EXPECT_EQ(section.shadow_tour(), nullptr);
}

TEST(PresetSection, RecordedTimesAreWholeSecondsRoundedUp) {
  PresetSection section(dome());
  EXPECT_EQ(value_of(section, "STourARecordedTime"), std::nullopt);
  section.shadow_tours[0].length = 2.1;
  EXPECT_EQ(value_of(section, "STourARecordedTime"), "3");
  section.shadow_tours[0].length = 3;
  EXPECT_EQ(value_of(section, "STourARecordedTime"), "3");
}

TEST(PresetSection, ShadowToursAreNamedByTheirLettersAlone) {
  PresetSection section(dome());
  EXPECT_EQ(section.shadow_tour_of("A"), &section.shadow_tours[0]);
  EXPECT_EQ(section.shadow_tour_of("B"), &section.shadow_tours[1]);
  for (const char* letter : {"", "C", "F", "a", "AB"}) EXPECT_EQ(section.shadow_tour_of(letter), nullptr) << letter;
}

}  // namespace
}  // namespace vexa::camera
