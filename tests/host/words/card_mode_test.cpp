// SPDX-License-Identifier: Apache-2.0
#include "host/words/card_mode.h"

#include <gtest/gtest.h>

namespace vexa::host {
namespace {

struct CardModeCase {
  const char* answer;
  bool enabled;
  int stream;
  int before;
  int after;
  const char* address;
};

TEST(CardMode, IsReadFromTheCamerasAnswer) {
  const CardModeCase cases[] = {
      {"Edgestorage=on&EsRec1=image2,off&EsAlmRec1Time=5,10&EsAlmRec1WatchAddress=192.168.0.2", true, 2, 5, 10,
       "192.168.0.2"},
      {"EsAlmRec1Time=0,60&Edgestorage=off&EsRec1=image1,on", false, 1, 0, 60, ""},
      {"Edgestorage=ON", false, 1, 0, 0, ""},
      {"EsAlmRec1WatchAddress=a=b", false, 1, 0, 0, "a=b"},
  };
  for (const CardModeCase& one : cases) {
    SCOPED_TRACE(one.answer);
    const SLibDEdgeStorageMode mode = read_card_mode(one.answer);
    EXPECT_EQ(mode.enabled, one.enabled);
    EXPECT_EQ(mode.imageNumber, one.stream);
    EXPECT_EQ(mode.alarmTime1, one.before);
    EXPECT_EQ(mode.alarmTime2, one.after);
    EXPECT_EQ(mode.watchAddress, one.address);
  }
}

TEST(CardMode, KeepsItsDefaultsWhereKeysOrNumbersAreMissing) {
  const char* const answers[] = {"",
                                 "&&=",
                                 "Edgestorage",
                                 "EsRec1=off",
                                 "EsRec1=image",
                                 "EsAlmRec1Time=",
                                 "EsAlmRec1Time=x,y",
                                 "OldEdgestorage=on",
                                 "EsRec1=image99999999999"};
  for (const char* answer : answers) {
    SCOPED_TRACE(answer);
    const SLibDEdgeStorageMode mode = read_card_mode(answer);
    EXPECT_FALSE(mode.enabled);
    EXPECT_EQ(mode.imageNumber, 1);
    EXPECT_EQ(mode.alarmTime1, 0);
    EXPECT_EQ(mode.alarmTime2, 0);
    EXPECT_EQ(mode.watchAddress, "");
  }
}

TEST(CardMode, TakesTheSecondsBeforeAloneWhenThereIsNoComma) {
  const SLibDEdgeStorageMode mode = read_card_mode("EsAlmRec1Time=7");
  EXPECT_EQ(mode.alarmTime1, 7);
  EXPECT_EQ(mode.alarmTime2, 0);
}

}  // namespace
}  // namespace vexa::host
