#include "virtual_camera/model/settings_store.h"

#include <gtest/gtest.h>

namespace vexa::camera {
namespace {

TEST(SettingsStore, KeysKeepTheOrderInWhichTheyWereFirstSet) {
  SettingsStore store;
  store.set("own", "B", "1");
  store.set("own", "A", "2");
  store.set("own", "B", "3");
  EXPECT_EQ(store.answer("own"), "B=3&A=2");
}

TEST(SettingsStore, CommandsChangeAndAddKeysWithoutDecoding) {
  const struct {
    const char* query;
    const char* answer;
  } cases[] = {{"A=2", "A=2"},
               {"A=%20", "A=%20"},
               {"B=1,2", "A=1&B=1,2"},
               {"B=x=y", "A=1&B=x=y"},
               {"B=", "A=1&B="},
               {"B", "A=1"},
               {"=x", "A=1"},
               {"&&B=1&", "A=1&B=1"},
               {"A=2&A=3", "A=3"},
               {"", "A=1"},
               {"B=1&C=2", "A=1&B=1&C=2"}};
  for (const auto& c : cases) {
    SettingsStore store;
    store.set("own", "A", "1");
    EXPECT_TRUE(store.apply("own", c.query));
    EXPECT_EQ(store.answer("own"), c.answer) << c.query;
  }
}

TEST(SettingsStore, GetAndEraseSeeWhatWasSet) {
  SettingsStore store;
  store.set("own", "A", "1");
  EXPECT_EQ(store.get("own", "A"), "1");
  EXPECT_EQ(store.get("own", "B"), std::nullopt);
  EXPECT_EQ(store.get("none", "A"), std::nullopt);
  store.erase("own", "A");
  store.erase("none", "A");
  EXPECT_EQ(store.get("own", "A"), std::nullopt);
  EXPECT_EQ(store.answer("own"), "");
  store.erase_section("own");
  EXPECT_EQ(store.answer("own"), std::nullopt);
}

TEST(SettingsStore, AnAnswerOfItsOwnHidesTheKeysUntilTakenBack) {
  SettingsStore store;
  store.set("own", "A", "1");
  store.set_answer("own", "anything&at=all");
  EXPECT_EQ(store.answer("own"), "anything&at=all");
  EXPECT_EQ(store.get("own", "A"), "1");
  store.set_answer("own", std::nullopt);
  EXPECT_EQ(store.answer("own"), "A=1");
}

TEST(SettingsStore, DefaultsAreThoseOfAPlausibleCamera) {
  const struct {
    const char* section;
    const char* key;
    const char* value;
  } cases[] = {{"system", "ModelName", "VX-2000"},
               {"system", "SoftVersion", "1.02.00"},
               {"system", "Serial", "100001"},
               {"system", "ContinuousPanTiltZoomFunc", "1"},
               {"system", "ChannelId", "1"},
               {"system", "TamperingFunc", "off"},
               {"network", "MacAddress", "02:00:00:00:00:01"},
               {"camera", "VideoStd", "pal"},
               {"camera", "ImageCodec1", "h264"},
               {"camera", "ImageSize1", "1920,1080"},
               {"camera", "FrameRate1", "25"},
               {"camera", "BitRate1", "8000"},
               {"camera", "RTSPPort", "554"},
               {"edgestorage", "EsRTSPRec1Timeout", "60"}};
  const SettingsStore store;
  for (const auto& c : cases) EXPECT_EQ(store.get(c.section, c.key), c.value) << c.key;
}

TEST(SettingsStore, EveryInquiryOfTheDriverHasASection) {
  const SettingsStore store;
  for (const char* name : {"system", "network", "camera", "presetposition", "sensor", "lod", "objectdetection",
                           "a-slot", "edgestorage", "audiodetection"}) {
    EXPECT_TRUE(store.answer(name)) << name;
  }
}

}  // namespace
}  // namespace vexa::camera
