// Presets on the wire.
#include <gtest/gtest.h>

#include <climits>
#include <string>
#include <vector>

#include "device/cgi/ptz_text.h"
#include "tests/device/ptz_reach.h"

namespace vexa_test {
namespace {

using Presets = std::vector<SLibDPresetInfo>;
using Names = std::vector<std::string>;

constexpr int kCount = 16;

void give_presets(PtzDriver& driver) {
  driver.m_FixedPTZControlInfo.presetCount = kCount;
  driver.m_FixedPTZControlInfo.panTilt.panMaxSpeed = 24;
  driver.m_FixedPTZControlInfo.panTilt.tiltMaxSpeed = 18;
  driver.m_SavedTimeout = kPatientTimeout;
}

ELibDReturnCode set_preset(PtzDriver& driver, int index, const std::string& name) {
  SLibDPresetInfo preset;
  preset.index = index;
  preset.name = name;
  return driver.SetPreset(preset);
}

TEST(UnnamedPresets, OfANegativeCountAreNone) {
  for (const int count : {0, -1, INT_MIN}) EXPECT_TRUE(vexa::unnamed_presets(count).empty()) << count;
}

std::string path_of(const std::string& rest) { return "/command/presetposition.cgi?" + rest; }

TEST(Presets, AreCountedFromOneOnTheWire) {
  std::vector<SentRow> rows;
  for (int index = 0; index < kCount; ++index) {
    const std::string number = std::to_string(index + 1);
    rows.push_back({[index](PtzDriver& d) { return d.RecallPreset(index); }, path_of("PresetCall=" + number + ",18")});
    rows.push_back({[index](PtzDriver& d) { return d.ClearPreset(index); }, path_of("PresetClear=" + number)});
    rows.push_back(
        {[index](PtzDriver& d) { return set_preset(d, index, "Gate"); }, path_of("PresetSet=" + number + ",Gate,on")});
  }
  expect_sent(rows, give_presets);
}

TEST(Presets, AreRecalledAtTheSmallerOfTheLargestSpeeds) {
  const SentRow row = {[](PtzDriver& d) { return d.RecallPreset(0); }, path_of("PresetCall=1,5")};
  expect_sent({row}, [](PtzDriver& driver) {
    give_presets(driver);
    driver.m_FixedPTZControlInfo.panTilt.panMaxSpeed = 5;
  });
}

TEST(Presets, HaveEveryByteOfTheirNamesEncoded) {
  std::vector<SentRow> rows;
  for (int byte = 0; byte < 256; ++byte) {
    const char digits[] = "0123456789ABCDEF";
    const bool plain = (byte >= '0' && byte <= '9') || (byte >= 'A' && byte <= 'Z') || (byte >= 'a' && byte <= 'z');
    const std::string name(1, static_cast<char>(byte));
    const std::string encoded = plain ? name : std::string("%") + digits[byte / 16] + digits[byte % 16];
    rows.push_back(
        {[name](PtzDriver& d) { return set_preset(d, 2, name); }, path_of("PresetSet=3," + encoded + ",on")});
  }
  rows.push_back({[](PtzDriver& d) { return set_preset(d, 0, "a\r\nHost: x\r\n\r\nGET /b,&=?#%"); },
                  path_of("PresetSet=1,a%0D%0AHost%3A%20x%0D%0A%0D%0AGET%20%2Fb%2C%26%3D%3F%23%25,on")});
  expect_sent(rows, give_presets);
}

TEST(Presets, WithANameThatIsTooLongForARequestAreNotSent) {
  PtzPlay play({});
  give_presets(play.driver);
  EXPECT_EQ(set_preset(play.driver, 0, std::string(4096, '\n')), LIBD_FAILED);
  EXPECT_EQ(text_of_latest_error(play.driver), "URL too long");
}

TEST(Presets, TellTheLatestErrorWhenTheyAreRefused) {
  expect_refusal_told({[](PtzDriver& d) { return d.RecallPreset(0); }, path_of("PresetCall=1,18")}, give_presets);
  expect_refusal_told({[](PtzDriver& d) { return d.ClearPreset(0); }, path_of("PresetClear=1")}, give_presets);
  expect_refusal_told({[](PtzDriver& d) { return set_preset(d, 0, "x"); }, path_of("PresetSet=1,x,on")}, give_presets);
}

TEST(SetPreset, PutsTheSavedTimeoutBackWhetherOrNotItSucceeded) {
  for (const bool taken : {true, false}) {
    const std::string path = path_of("PresetSet=1,x,on");
    PtzPlay play({taken ? command(path) : refusal(path)});
    give_presets(play.driver);
    play.driver.m_ConnectionInfo.timeout = 4321;
    play.driver.m_SavedTimeout = 1234;
    EXPECT_EQ(set_preset(play.driver, 0, "x"), taken ? LIBD_OK : LIBD_UNAUTHORIZED);
    EXPECT_EQ(play.driver.m_ConnectionInfo.timeout, 1234);
  }
}

TEST(SetPreset, WaitsLongerThanTheConnectionAllows) {
  ScriptStep slow = command(path_of("PresetSet=1,x,on"));
  slow.piece = 9;
  slow.pause = 60;
  PtzPlay play({slow});
  give_presets(play.driver);
  play.driver.m_ConnectionInfo.timeout = play.driver.m_SavedTimeout = 20;
  EXPECT_EQ(set_preset(play.driver, 0, "x"), LIBD_OK);
}

using PresetsUnsent = PtzUnsent;

TEST_F(PresetsUnsent, BecauseTheIndexIsNoPreset) {
  for (const int count : {kCount, 0, -1}) {
    give_presets(driver_);
    driver_.m_FixedPTZControlInfo.presetCount = count;
    for (const int index : {-1, kCount, kCount + 1, INT_MIN, INT_MAX}) {
      EXPECT_EQ(driver_.RecallPreset(index), LIBD_INVALID_ARGUMENT) << index;
      EXPECT_EQ(driver_.ClearPreset(index), LIBD_INVALID_ARGUMENT) << index;
      EXPECT_EQ(set_preset(driver_, index, "Gate"), LIBD_INVALID_ARGUMENT) << index;
    }
  }
}

TEST_F(PresetsUnsent, BecauseTheNameIsEmpty) {
  give_presets(driver_);
  EXPECT_EQ(set_preset(driver_, 0, ""), LIBD_INVALID_ARGUMENT);
}

struct PresetListRow {
  const char* answer;
  int result;
  Names named;  ///< of the first three presets; the others have none
};

class PresetList : public testing::TestWithParam<PresetListRow> {};

TEST_P(PresetList, IsReadAsFarAsItIsWellFormed) {
  PtzPlay play({inquiry("presetposition", GetParam().answer)});
  give_presets(play.driver);
  Presets presets(5);
  presets[0].name = "from before";
  EXPECT_EQ(play.driver.GetPresets(presets), GetParam().result) << GetParam().answer;
  Names expected = GetParam().named;
  expected.resize(kCount);
  ASSERT_EQ(presets.size(), static_cast<std::size_t>(kCount));
  for (std::size_t i = 0; i < presets.size(); ++i) {
    EXPECT_EQ(presets[i].index, static_cast<int>(i)) << GetParam().answer;
    EXPECT_EQ(presets[i].name, expected[i]) << GetParam().answer;
  }
}

INSTANTIATE_TEST_SUITE_P(
    Rows, PresetList,
    testing::Values(PresetListRow{"HomePos=on&PresetName=1,Gate,3,Door&Tour=off", 1, {"Gate", "", "Door"}},
                    PresetListRow{"PresetName=1,Gate", 1, {"Gate"}},
                    PresetListRow{"PresetName=2,B,1,A,2,C", 1, {"A", "C"}},
                    PresetListRow{"PresetName=1,Main%20gate%2C+x", 1, {"Main%20gate%2C+x"}},
                    PresetListRow{"PresetName= 2x,Gate", 1, {"", "Gate"}},
                    PresetListRow{"PresetName=1,Gate,,Door", 0, {"Gate"}}, PresetListRow{"PresetName=1,,3,Door", 0, {}},
                    PresetListRow{"PresetName=,Gate,3,Door", 0, {}}, PresetListRow{"PresetName=1,Gate,3", 0, {"Gate"}},
                    PresetListRow{"PresetName=1,Gate,3,", 0, {"Gate"}},
                    PresetListRow{"PresetName=1,Gate,", 0, {"Gate"}}, PresetListRow{"PresetName=1", 0, {}},
                    PresetListRow{"PresetName=,", 0, {}}, PresetListRow{"PresetName=17,X", 0, {}},
                    PresetListRow{"PresetName=1,A,17,X,2,B", 0, {"A"}}, PresetListRow{"PresetName=0,X", 0, {}},
                    PresetListRow{"PresetName=-1,X", 0, {}}, PresetListRow{"PresetName=x,X", 0, {}},
                    PresetListRow{"PresetName=-99999999999,X", 0, {}}, PresetListRow{"PresetName=99999999999,X", 0, {}},
                    PresetListRow{"PresetName=", 0, {}}, PresetListRow{"PresetName=&Tour=on", 0, {}},
                    PresetListRow{"Tour=on", 0, {}}, PresetListRow{"", 0, {}},
                    PresetListRow{"OldPresetName=1,A&PresetName=1,B", 1, {"A"}}));

TEST(GetPresets, KeepsTheUnnamedListWhenTheInquiryFails) {
  PtzPlay play({refusal("/command/inquiry.cgi?inq=presetposition")});
  give_presets(play.driver);
  Presets presets;
  EXPECT_EQ(play.driver.GetPresets(presets), LIBD_UNAUTHORIZED);
  ASSERT_EQ(presets.size(), static_cast<std::size_t>(kCount));
  EXPECT_EQ(presets[15].index, 15);
  EXPECT_EQ(presets[15].name, "");
}

TEST(GetPresets, OfACameraWithoutPresetsIsEmpty) {
  for (const int count : {0, -5}) {
    PtzPlay play({inquiry("presetposition", "PresetName=1,A")});
    play.driver.m_FixedPTZControlInfo.presetCount = count;
    Presets presets(3);
    EXPECT_EQ(play.driver.GetPresets(presets), LIBD_FAILED);
    EXPECT_TRUE(presets.empty());
  }
}

TEST(GetPresets, TakesEveryByteThatIsNoMarkIntoAName) {
  std::string name;
  for (int byte = 1; byte < 256; ++byte) {
    if (byte != '&' && byte != ',') name.push_back(static_cast<char>(byte));
  }
  PtzPlay play({inquiry("presetposition", "PresetName=4," + name)});
  give_presets(play.driver);
  Presets presets;
  EXPECT_EQ(play.driver.GetPresets(presets), LIBD_OK);
  EXPECT_EQ(presets[3].name, name);
}

}  // namespace
}  // namespace vexa_test
