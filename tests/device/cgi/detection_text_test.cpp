#include "device/cgi/detection_text.h"

#include <gtest/gtest.h>

#include <climits>
#include <functional>
#include <string>
#include <vector>

#include "tests/device/detection_records.h"

namespace vexa {
namespace {

using vexa_test::marked_setting;
using vexa_test::numbers_of;
using vexa_test::setting_rows;

TEST(LodSettings, AreSeventeenAlike) {
  const auto settings = lod_settings("LODFunc=on&LODMinObjectSize=middle&LODSensitivity=40");
  ASSERT_EQ(settings.size(), 17U);
  SLibDDetectionParam expected;
  expected.windows[0].minObjectWidth = 1;
  expected.windows[0].sensitivity = 40;
  for (const auto& setting : settings) EXPECT_EQ(setting_rows(setting), setting_rows(expected));
}

TEST(LodSettings, AreReadFromSizeWordAndNumber) {
  const struct {
    const char* answer;
    int size;
    int sensitivity;
  } rows[] = {{"LODMinObjectSize=small&LODSensitivity=1", 0, 1},
              {"LODSensitivity=100&LODMinObjectSize=large", 2, 100},
              {"LODMinObjectSize=large&LODSensitivity= 7x", 2, 7},
              {"LODMinObjectSize=small&LODSensitivity=-5", 0, -5},
              {"LODMinObjectSize=small&LODSensitivity=99999999999", 0, INT_MAX}};
  for (const auto& row : rows) {
    const auto settings = lod_settings(row.answer);
    ASSERT_EQ(settings.size(), 17U) << row.answer;
    EXPECT_EQ(settings[16].windows[0].minObjectWidth, row.size) << row.answer;
    EXPECT_EQ(settings[16].windows[0].sensitivity, row.sensitivity) << row.answer;
  }
}

TEST(LodSettings, AreNoneWithoutAKnownSizeAndASensitivity) {
  for (const char* answer :
       {"", "LODSensitivity=40", "LODMinObjectSize=middle", "LODMinObjectSize=huge&LODSensitivity=40",
        "LODMinObjectSize=&LODSensitivity=40", "LODMinObjectSize=Middle&LODSensitivity=40",
        "LODMinObjectSize=middle&LODSensitivity=", "LODMinObjectSize=middle&LODSensitivity=x",
        "LODMinObjectSize=middle &LODSensitivity=40", "LODMinObjectSize=middle&LODSensitivity=-"}) {
    EXPECT_TRUE(lod_settings(answer).empty()) << answer;
  }
}

TEST(Sensitivity, Is1To100) {
  const struct {
    int sensitivity;
    bool valid;
  } rows[] = {{INT_MIN, false}, {-1, false}, {0, false}, {1, true}, {100, true}, {101, false}, {INT_MAX, false}};
  for (const auto& row : rows) {
    SLibDDetectionParam param;
    param.windows[0].sensitivity = row.sensitivity;
    EXPECT_EQ(has_sensitivity(param), row.valid) << row.sensitivity;
  }
}

TEST(Areas, AreTwoPointsInEachWindow) {
  EXPECT_TRUE(has_areas(marked_setting(1)));
  for (std::size_t window = 0; window < 4; ++window) {
    for (const std::size_t points : {0U, 1U, 3U, 32U}) {
      SLibDDetectionParam param = marked_setting(1);
      param.windows[window].area.resize(points);
      EXPECT_FALSE(has_areas(param)) << window << ' ' << points;
    }
  }
}

TEST(PositionMode, IsCurrentForThatWordAlone) {
  const struct {
    const char* answer;
    std::optional<ELibDPositionMode> mode;
  } rows[] = {{"PositionMode=current&x", LIBD_POSITION_CURRENT},
              {"x&PositionMode=preset", LIBD_POSITION_PRESET},
              {"PositionMode=Current", LIBD_POSITION_PRESET},
              {"PositionMode=", LIBD_POSITION_PRESET},
              {"PositionMode", std::nullopt},
              {"", std::nullopt}};
  for (const auto& row : rows) EXPECT_EQ(position_mode_of(row.answer), row.mode) << row.answer;
}

/// The one setting that `items` give; they are of the current view.
SLibDDetectionParam current_view(const std::string& items) {
  const auto settings = object_settings("ODPreDef=0&" + items, true);
  EXPECT_EQ(numbers_of(settings), std::vector<int>{99}) << items;
  return settings.empty() ? SLibDDetectionParam{} : settings.front();
}

SLibDDetectionParam blank_current_view() {
  SLibDDetectionParam param;
  param.number = 99;
  return param;
}

void for_all_windows(SLibDDetectionParam& param, const std::function<void(SLibDDetectionWindow&)>& change) {
  for (SLibDDetectionWindow& window : param.windows) change(window);
}

TEST(ObjectItems, OfModeAndCandidateFrameAreReadAndNotKept) {
  for (const char* item : {"Od99Mode=object", "Od99CandidateFrame=5", "Od 99Mode= x"}) {
    EXPECT_EQ(setting_rows(current_view(item)), setting_rows(blank_current_view())) << item;
  }
}

TEST(ObjectItems, OfAnyThresholdAreTheSensitivityOfAllWindows) {
  for (const char* item : {"Od99ThresholdR=33", "Od99ThresholdG=33", "Od99ThresholdB=33", "Od99ThresholdB= 33x"}) {
    SLibDDetectionParam expected = blank_current_view();
    for_all_windows(expected, [](auto& window) { window.sensitivity = 33; });
    EXPECT_EQ(setting_rows(current_view(item)), setting_rows(expected)) << item;
  }
}

TEST(ObjectItems, OfSizesAreThoseOfAllWindows) {
  SLibDDetectionParam smallest = blank_current_view();
  for_all_windows(smallest, [](auto& window) { window.minObjectWidth = 3, window.minObjectHeight = -4; });
  EXPECT_EQ(setting_rows(current_view("Od99MinObjectSize=3,-4")), setting_rows(smallest));
  SLibDDetectionParam largest = blank_current_view();
  for_all_windows(largest, [](auto& window) { window.maxObjectWidth = 5, window.maxObjectHeight = INT_MAX; });
  EXPECT_EQ(setting_rows(current_view("Od99MaxObjectSize=5, 99999999999")), setting_rows(largest));
}

TEST(ObjectItems, OfAWindowAreThatWindowsAlone) {
  for (std::size_t k = 0; k < 4; ++k) {
    const std::string win = "Od99Win" + std::to_string(k + 1);
    const struct {
      std::string item;
      std::function<void(SLibDDetectionWindow&)> set;
    } rows[] = {{win + "=on", [](auto& w) { w.enabled = 1; }},
                {win + "=off", [](auto& w) { w.enabled = 0; }},
                {win + "=ON", [](auto& w) { w.enabled = 0; }},
                {win + "= on x", [](auto& w) { w.enabled = 1; }},
                {win + "Area=1,2,3,4",
                 [](auto& w) {
                   w.area = {{1, 2}, {3, 4}};
                 }},
                {win + "Area=1,2,3,4&" + win + "Area=5,6,7,8,9",
                 [](auto& w) {
                   w.area = {{5, 6}, {7, 8}};
                 }},
                {win + "Mode=det", [](auto& w) { w.mode = 0; }},
                {win + "Mode=mask", [](auto& w) { w.mode = 1; }},
                {win + "Mode=dets", [](auto& w) { w.mode = 1; }}};
    for (const auto& row : rows) {
      SLibDDetectionParam expected = blank_current_view();
      row.set(expected.windows[k]);
      EXPECT_EQ(setting_rows(current_view(row.item)), setting_rows(expected)) << row.item;
    }
  }
}

TEST(ObjectItems, OfNoFormAreSkipped) {
  for (const char* item : {"Od99Mode=",
                           "Od99Mode= ",
                           "Od99ThresholdR=",
                           "Od99ThresholdR=x",
                           "Od99ThresholdC=1",
                           "Od99MinObjectSize=1",
                           "Od99MinObjectSize=1,",
                           "Od99MinObjectSize=1;2",
                           "Od99MinObjectSize=1 ,2",
                           "Od99Win0=on",
                           "Od99Win5=on",
                           "Od99Win=on",
                           "Od99Win12=on",
                           "Od99Win1=",
                           "Od99Win1Area=1,2,3",
                           "Od99Win1Area=1,2,3,",
                           "Od99Win1Mode=",
                           "OdMode=x",
                           "Odx99Mode=x",
                           "od99Mode=x",
                           "xOd99Mode=x",
                           " Od99Mode=x",
                           "Od99",
                           "Od",
                           "",
                           "Od99 Mode=x",
                           "Od99CandidateFrame=",
                           "Od99Win1 =on",
                           "Od99mode=x"}) {
    EXPECT_TRUE(object_settings(std::string("ODPreDef=0&") + item, true).empty()) << item;
  }
}

TEST(ObjectSettings, BeginBehindTheLastPreDefAndItsItem) {
  const struct {
    const char* answer;
    std::vector<int> numbers;
  } rows[] = {{"", {}},
              {"Od99Mode=x", {}},
              {"ODPreDef", {}},
              {"ODPreDef=Od99Mode=x", {}},
              {"ODPreDef&Od99Mode=x", {99}},
              {"Od99Mode=x&ODPreDef=1", {}},
              {"ODPreDef=1&Od99Mode=x&ODPreDef=2", {}},
              {"ODPreDef=1&Od1Mode=x&ODPreDef2=3&Od99Mode=x", {99}}};
  for (const auto& row : rows) EXPECT_EQ(numbers_of(object_settings(row.answer, true)), row.numbers) << row.answer;
}

TEST(ObjectSettings, AreOneANumberAndTheLastOnlyOfTheCurrentView) {
  const struct {
    const char* items;
    bool presets;
    std::vector<int> numbers;
  } rows[] = {{"Od1Mode=x&Od2Mode=x", true, {1}},
              {"Od1Mode=x&Od2Mode=x&Od99Mode=x", true, {1, 2, 99}},
              {"Od99Mode=x&Od1Mode=x", true, {99}},
              {"Od1Mode=x&Od1Mode=y", true, {}},
              {"Od1Mode=x&Od2Mode=x&Od1Mode=x&Od99Mode=x", true, {1, 2, 1, 99}},
              {"Od1Mode=x&Od2Mode=&Od99Mode=x", true, {1, 99}},
              {"Od-1Mode=x&Od99Mode=x", true, {99}},
              {"Od01Mode=x&Od1Mode=x&Od2Mode=x", true, {1}},
              {"Od1Mode=x&Od2Mode=x", false, {}},
              {"Od1Mode=x&Od2Mode=x&Od99Mode=x", false, {99}},
              {"Od99Mode=x&Od1Mode=x", false, {}}};
  for (const auto& row : rows) {
    const auto settings = object_settings(std::string("ODPreDef=0&") + row.items, row.presets);
    EXPECT_EQ(numbers_of(settings), row.numbers) << row.items << ' ' << row.presets;
  }
}

TEST(ObjectSettings, InheritWhatTheirOwnItemsDoNotSet) {
  const auto settings = object_settings(
      "ODPreDef=0&Od1ThresholdR=10&Od1Win1=on&Od1Win1Area=1,2,3,4&Od2Win2=on&Od2ThresholdR=20&Od99Win1=off", true);
  ASSERT_EQ(numbers_of(settings), (std::vector<int>{1, 2, 99}));
  EXPECT_EQ(settings[0].windows[0].sensitivity, 10);
  EXPECT_EQ(settings[0].windows[1].enabled, -1);
  EXPECT_EQ(settings[1].windows[0].enabled, 1);
  EXPECT_EQ(settings[1].windows[1].enabled, 1);
  EXPECT_EQ(settings[1].windows[0].area.size(), 2U);
  EXPECT_EQ(settings[2].windows[0].enabled, 0);
  EXPECT_EQ(settings[2].windows[1].enabled, 1);
  EXPECT_EQ(settings[2].windows[3].sensitivity, 20);
  EXPECT_EQ(settings[2].windows[0].area[1].y, 4);
}

TEST(ObjectSettings, AreReadFromAnAnswerCutAnywhere) {
  const std::string answer = "PositionMode=current&ODPreDef=0&Od1Mode=x&Od1Win1Area=1,2,3,4&Od99Win4Mode=det";
  for (std::size_t length = 0; length <= answer.size(); ++length) {
    EXPECT_LE(object_settings(answer.substr(0, length), true).size(), 2U) << length;
  }
  EXPECT_EQ(object_settings(answer, true).size(), 2U);
}

TEST(ObjectRequests, AreWholeAndInTheirOrder) {
  const SLibDDetectionParam param = marked_setting(7);
  EXPECT_EQ(object_size_request(param),
            "/command/objectdetection.cgi?Od07ThresholdR=42&Od07ThresholdG=42&Od07ThresholdB=42"
            "&Od07MinObjectSize=101,102&Od07MaxObjectSize=103,104");
  EXPECT_EQ(first_windows_request(param),
            "/command/objectdetection.cgi?Od07Win1=off&Od07Win1Area=10,11,12,13&Od07Win1Mode=mask"
            "&Od07Win2=on&Od07Win2Area=17,18,19,20&Od07Win2Mode=mask");
  EXPECT_EQ(last_windows_request(param),
            "/command/objectdetection.cgi?Od07Win3=off&Od07Win3Area=24,25,26,27&Od07Win3Mode=det"
            "&Od07Win4=on&Od07Win4Area=31,32,33,34&Od07Win4Mode=mask");
}

TEST(ObjectRequests, TakeSizesAndSensitivityFromTheFirstWindow) {
  SLibDDetectionParam param = marked_setting(99);
  for (std::size_t k = 1; k < 4; ++k) param.windows[k].sensitivity = param.windows[k].minObjectWidth = 9;
  EXPECT_EQ(object_size_request(param),
            "/command/objectdetection.cgi?Od99ThresholdR=42&Od99ThresholdG=42&Od99ThresholdB=42"
            "&Od99MinObjectSize=101,102&Od99MaxObjectSize=103,104");
}

TEST(ObjectRequests, AreOnForExactly1AndMaskForAnyModeBut0) {
  const struct {
    int enabled;
    int mode;
    const char* words;
  } rows[] = {
      {1, 0, "on det"}, {0, 1, "off mask"}, {2, 2, "off mask"}, {-1, -1, "off mask"}, {INT_MAX, INT_MIN, "off mask"}};
  for (const auto& row : rows) {
    SLibDDetectionParam param = marked_setting(1);
    param.windows[3].enabled = row.enabled;
    param.windows[3].mode = row.mode;
    const std::string request = last_windows_request(param);
    const std::string words(row.words);
    const std::size_t blank = words.find(' ');
    EXPECT_NE(request.find("&Od01Win4=" + words.substr(0, blank) + "&"), std::string::npos) << request;
    EXPECT_TRUE(request.ends_with("&Od01Win4Mode=" + words.substr(blank + 1))) << request;
  }
}

TEST(ObjectRequests, HoldEveryNumberWhole) {
  SLibDDetectionParam param = marked_setting(INT_MIN);
  for (SLibDDetectionWindow& window : param.windows) window.area = {{INT_MIN, INT_MIN}, {INT_MIN, INT_MIN}};
  EXPECT_TRUE(last_windows_request(param).ends_with("&Od-2147483648Win4Mode=mask"));
  EXPECT_NE(first_windows_request(param).find("=-2147483648,-2147483648,-2147483648,-2147483648&"), std::string::npos);
}

}  // namespace
}  // namespace vexa
