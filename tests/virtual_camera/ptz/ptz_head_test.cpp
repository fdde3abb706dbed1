// SPDX-License-Identifier: Apache-2.0
// A moving head on a clock that the test sets: its reports, presets, tours.
#include "virtual_camera/ptz/ptz_head.h"
#include "virtual_camera/wire/message.h"

#include <gtest/gtest.h>

#include <map>
#include <string>

#include "tests/virtual_camera/ptz/ptz_models.h"

namespace vexa::camera {
namespace {

using std::chrono::milliseconds;

class PtzHeadTest : public testing::Test {
 protected:
  // Seconds from the start.
  [[nodiscard]] PtzHead::Time at(double seconds) const {
    return start_ + milliseconds(static_cast<std::int64_t>(seconds * 1000));
  }
  bool move(double seconds, const std::string& query) {
    return head_.move(query_pairs(query), {{640, 480}, false}, at(seconds));
  }
  bool presets(double seconds, const std::string& query) {
    return head_.command_presets(query_pairs(query), at(seconds));
  }
  std::string setting(double seconds, const std::string& key) {
    for (const auto& [name, value] : head_.preset_settings(at(seconds))) {
      if (name == key) return value;
    }
    return "none";
  }
  int pan(double seconds) { return head_.place(at(seconds))[0]; }

  // Presets 1, 2, 3 at pan -1000, 0 and 1000; the clock then stands at 100 seconds, the head at pan 1000.
  void set_three_presets() {
    ASSERT_TRUE(move(0, "AbsolutePanTilt=FC18,0000,20"));
    ASSERT_TRUE(presets(30, "PresetSet=1,left,on"));
    ASSERT_TRUE(move(30, "AbsolutePanTilt=0000,0000,20"));
    ASSERT_TRUE(presets(60, "PresetSet=2,middle,on"));
    ASSERT_TRUE(move(60, "AbsolutePanTilt=03E8,0000,20"));
    ASSERT_TRUE(presets(100, "PresetSet=3,right,off"));
  }

  // A shadow tour B: right for two seconds, then zoomed in.
  void record_a_tour() {
    ASSERT_TRUE(presets(10, "STourRecord=B"));
    ASSERT_TRUE(move(11, "Move=right,24"));
    ASSERT_TRUE(move(13, "Move=stop,motor"));
    ASSERT_TRUE(move(15, "AbsoluteZoom=0FA0"));
    ASSERT_TRUE(presets(24.5, "STourRecord=stop"));
  }

  PtzHead::Time start_ = PtzHead::Time(std::chrono::hours(1000));
  PtzHead head_{dome(), start_, 1};
};

TEST_F(PtzHeadTest, ReportsItsDirection) {
  EXPECT_EQ(head_.pose(false, at(0)).user_data, "CamPos: 111000000000000S");
  ASSERT_TRUE(move(0, "AbsolutePanTilt=FC18,0640,20"));
  ASSERT_TRUE(move(0, "AbsoluteZoom=0FA0"));
  EXPECT_EQ(head_.pose(false, at(0.5)).user_data.back(), 'M');
  const CameraPose pose = head_.pose(false, at(60));
  EXPECT_EQ(pose.user_data, "CamPos: 111FC1806400FA0S");
  EXPECT_DOUBLE_EQ(pose.pan, -6.25);
  EXPECT_DOUBLE_EQ(pose.tilt, 10);
  EXPECT_DOUBLE_EQ(pose.horizontal_angle, 29);
}

TEST_F(PtzHeadTest, ReportsThePositionNegatedInATurnedPicture) {
  ASSERT_TRUE(move(0, "AbsolutePanTilt=FC18,0640,20"));
  EXPECT_EQ(head_.pose(true, at(60)).user_data, "CamPos: 11103E8F9C00000S");
  EXPECT_DOUBLE_EQ(head_.pose(true, at(60)).pan, -6.25) << "the motors have not moved";
}

TEST_F(PtzHeadTest, ItsClockNeverFalls) {
  ASSERT_TRUE(move(10, "Move=right,24"));
  const int place = pan(12);
  EXPECT_GT(place, 0);
  EXPECT_EQ(pan(11), place);
}

TEST_F(PtzHeadTest, MovesFasterThanLifeAtItsPace) {
  PtzHead fast(dome(), start_, 1000);
  ASSERT_TRUE(fast.move({{"Move", "right,24"}}, {}, at(0)));
  EXPECT_EQ(fast.place(at(0.005))[0], 25920) << "after five of ten seconds, one of them to speed up in";
  EXPECT_EQ(fast.place(at(0.020))[0], 28800);
}

TEST_F(PtzHeadTest, ACommandWithAMistakeMovesNothing) {
  EXPECT_FALSE(move(0, "Move=right,24&AbsoluteZoom=FFFF"));
  EXPECT_FALSE(move(0, ""));
  EXPECT_EQ(head_.pose(false, at(5)).user_data, "CamPos: 111000000000000S");
  EXPECT_TRUE(move(5, "Move=right,24&AbsoluteZoom=0010"));
  EXPECT_EQ(head_.pose(false, at(60)).user_data, "CamPos: 111708000000010S");
}

TEST_F(PtzHeadTest, RecallsWhatWasSet) {
  set_three_presets();
  EXPECT_TRUE(presets(100, "PresetCall=1,20"));
  EXPECT_EQ(pan(130), -1000);
  EXPECT_EQ(setting(130, "PresetName"), "1,left,2,middle,3,right");
  EXPECT_TRUE(presets(130, "PresetClear=2"));
  EXPECT_EQ(setting(130, "PresetName"), "1,left,3,right");
  EXPECT_EQ(setting(130, "PresetNum"), "2");
  EXPECT_FALSE(presets(130, "PresetCall=2,20"));
}

TEST_F(PtzHeadTest, WithoutPresetsItNamesNone) { EXPECT_EQ(setting(0, "PresetName"), "none"); }

TEST_F(PtzHeadTest, RefusesPresetsOutOfRangeOrMisspelt) {
  ASSERT_TRUE(presets(0, "PresetSet=1,x,on"));
  for (const std::string& query : {std::string("PresetSet=0,a,on"),
                                   std::string("PresetSet=17,a,on"),
                                   std::string("PresetSet=1,,on"),
                                   std::string("PresetSet=1,a"),
                                   std::string("PresetSet=1,a,yes"),
                                   std::string("PresetSet=1,a,b,on"),
                                   std::string("PresetSet=1,%4,on"),
                                   std::string("PresetSet=1,%GG,on"),
                                   std::string("PresetSet=1,%,on"),
                                   "PresetSet=1," + std::string(129, 'n') + ",on",
                                   std::string("PresetCall=1,0"),
                                   std::string("PresetCall=1,21"),
                                   std::string("PresetCall=1"),
                                   std::string("PresetCall=2,20"),
                                   std::string("PresetCall=0,20"),
                                   std::string("PresetClear=0"),
                                   std::string("PresetClear=17"),
                                   std::string("PresetClear="),
                                   std::string("PresetCall=1,20&PresetCall=1,20"),
                                   std::string("Preset=1"),
                                   std::string()}) {
    EXPECT_FALSE(presets(1, query)) << query;
  }
  EXPECT_EQ(setting(1, "PresetName"), "1,x");
  EXPECT_TRUE(presets(1, "PresetSet=16," + std::string(128, 'n') + ",on"));
}

TEST_F(PtzHeadTest, KeepsNamesOfAnyBytesApartFromTheList) {
  ASSERT_TRUE(presets(0, "PresetSet=1,Main%20gate,on"));
  ASSERT_TRUE(presets(0, "PresetSet=2,a%2Cb%26Tour%3Don%25%00%0D%0A%7F,on"));
  ASSERT_TRUE(presets(0, "PresetSet=3,T%C3%BCr,on"));
  EXPECT_EQ(setting(0, "PresetName"), "1,Main gate,2,a%2Cb%26Tour=on%25%00%0D%0A%7F,3,T\xC3\xBCr");
}

TEST_F(PtzHeadTest, PercentTextsOfEveryByteComeBack) {
  for (int byte = 0; byte < 256; ++byte) {
    const std::string text(1, static_cast<char>(byte));
    EXPECT_EQ(percent_decoded(percent_encoded_for_list(text)), text) << byte;
  }
}

TEST_F(PtzHeadTest, ATourVisitsItsPresetsAndStaysAtEach) {
  set_three_presets();
  ASSERT_TRUE(presets(100, "Tour=on&TourA=on&TourASequence=1,3,2&TourAStaytime=10&TourAPeriod=always&TourASpeed=20"));
  // At speed 20 of 24 the 2000 units take 1.18 s, 1000 less; times below lie in the stays.
  EXPECT_EQ(pan(105), -1000);
  EXPECT_EQ(pan(117), 1000);
  EXPECT_EQ(pan(128), 0);
  EXPECT_EQ(pan(139), -1000);
  EXPECT_EQ(setting(139, "Tour"), "on");
  ASSERT_TRUE(presets(139, "Tour=off"));
  EXPECT_EQ(pan(500), -1000);
}

TEST_F(PtzHeadTest, ATourSkipsPresetsThatAreNotSet) {
  set_three_presets();
  ASSERT_TRUE(presets(100, "Tour=on&TourA=on&TourASequence=9,1,8,3,7&TourAStaytime=10"));
  EXPECT_EQ(pan(105), -1000);
  EXPECT_EQ(pan(117), 1000);
  EXPECT_EQ(pan(128), -1000);
}

TEST_F(PtzHeadTest, ATourWithoutAPresetThatIsSetRests) {
  ASSERT_TRUE(presets(0, "Tour=on&TourA=on&TourASequence=1,2"));
  EXPECT_EQ(head_.pose(false, at(1e6)).user_data, "CamPos: 111000000000000S");
}

TEST_F(PtzHeadTest, AfterYearsATourIsWhereItWouldBe) {
  set_three_presets();
  const std::string tour = "Tour=on&TourA=on&TourASequence=1,3&TourAStaytime=10";
  ASSERT_TRUE(presets(100, tour));
  PtzHead watched(dome(), start_, 1);
  for (const auto& [seconds, query] :
       std::map<double, std::string>{{30, "PresetSet=1,left,on"}, {90, "PresetSet=3,right,on"}}) {
    const char* place = seconds < 60 ? "FC18,0000,20" : "03E8,0000,20";
    ASSERT_TRUE(watched.move({{"AbsolutePanTilt", place}}, {}, at(seconds - 29)));
    ASSERT_TRUE(watched.command_presets(query_pairs(query), at(seconds)));
  }
  ASSERT_TRUE(watched.command_presets(query_pairs(tour), at(100)));
  for (double seconds = 100; seconds < 2000; seconds += 1) (void)watched.place(at(seconds));
  for (double seconds = 2000; seconds < 2030; seconds += 0.25) {
    ASSERT_NEAR(pan(seconds), watched.place(at(seconds))[0], 1) << seconds;
  }
  const PtzHead::Time far = at(3e9);
  const int place = head_.place(far)[0];
  EXPECT_GE(place, -1000);
  EXPECT_LE(place, 1000);
}

TEST_F(PtzHeadTest, AMoveByHandInterruptsATourForItsResumeTime) {
  set_three_presets();
  ASSERT_TRUE(presets(100, "Tour=on&TourResume=on&TourRsmTime=60&TourA=on&TourASequence=1,3&TourAStaytime=10"));
  EXPECT_EQ(pan(105), -1000);
  ASSERT_TRUE(move(106, "AbsolutePanTilt=1000,0000,20"));
  EXPECT_EQ(pan(120), 4096);
  EXPECT_EQ(pan(165), 4096);
  EXPECT_EQ(setting(165, "Tour"), "on");
  EXPECT_EQ(pan(175), 1000) << "it goes on with the next preset";
  EXPECT_EQ(pan(185), -1000);
}

TEST_F(PtzHeadTest, TheResumeTimeCountsFromTheLastMovesRest) {
  set_three_presets();
  ASSERT_TRUE(presets(100, "Tour=on&TourResume=on&TourRsmTime=5&TourA=on&TourASequence=1,3&TourAStaytime=10"));
  ASSERT_TRUE(move(103, "Move=right,3"));
  EXPECT_GT(pan(120), 5000) << "it still runs";
  ASSERT_TRUE(move(120, "Move=stop,motor"));
  const int place = pan(123);
  EXPECT_EQ(pan(124), place);
  EXPECT_NE(pan(140), place);
}

TEST_F(PtzHeadTest, WithoutResumingAMoveByHandEndsTheTour) {
  set_three_presets();
  ASSERT_TRUE(presets(100, "Tour=on&TourResume=off&TourA=on&TourASequence=1,3"));
  EXPECT_EQ(setting(101, "TourResume"), "off");
  EXPECT_EQ(setting(101, "TourRsmTime"), "none");
  ASSERT_TRUE(presets(105, "PresetCall=2,20"));
  EXPECT_EQ(setting(106, "Tour"), "off");
  EXPECT_EQ(setting(106, "TourA"), "on");
  EXPECT_EQ(pan(1000), 0);
}

TEST_F(PtzHeadTest, TakesTheSettingsOfToursAsHostsWriteThem) {
  ASSERT_TRUE(presets(0,
                      "Tour=on&TourResume=on&TourRsmTime=30&TourA=on&TourASequence=1,2,3&TourAStaytime=15"
                      "&TourAPeriod=always&TourASpeed=20&TourB=off&TourBSequence=4,5&TourBStaytime=5"
                      "&TourBPeriod=always&TourBSpeed=12"));
  std::string text;
  for (const auto& [key, value] : head_.preset_settings(at(0))) text += "&" + key + "=" + value;
  EXPECT_EQ(text,
            "&PresetNum=0&Tour=on&TourResume=on&TourRsmTime=30&TourA=on&TourASequence=1,2,3&TourAStaytime=15"
            "&TourAPeriod=always&TourASpeed=20&TourB=off&TourBSequence=4,5&TourBStaytime=5&TourBPeriod=always"
            "&TourBSpeed=12&STour=off&STourResume=off&STourMaxRecordTime=60&STourA=off&STourAPeriod=always&STourB=off"
            "&STourBPeriod=always");
}

TEST_F(PtzHeadTest, RefusesSettingsOfToursWhole) {
  for (const char* query : {"Tour=yes",
                            "TourC=on",
                            "TourC=off",
                            "TourA=on&TourB=on",
                            "TourASequence=1",
                            "TourASequence=1,17",
                            "TourASequence=0,1",
                            "TourASequence=1,,2",
                            "TourASequence=",
                            "TourAStaytime=0",
                            "TourAStaytime=10000000",
                            "TourASpeed=21",
                            "TourASpeed=0",
                            "TourAPeriod=daily",
                            "TourAName=x",
                            "TourResume=maybe",
                            "TourRsmTime=0",

                            "Tours=on",
                            "STourC=on",
                            "STourA=on&STourB=on",
                            "STourASequence=1,2",
                            "STourMaxRecordTime=9",
                            "STourARecordedTime=9",
                            "STourRecord=C",
                            "STourRecord=",
                            "STourRecord=AB",
                            "STourPreview=A",
                            "Tours=",
                            "X=1"}) {
    EXPECT_FALSE(presets(0, query)) << query;
    EXPECT_FALSE(presets(0, "Tour=on&" + std::string(query))) << query;
  }
  EXPECT_EQ(setting(0, "Tour"), "off");
}

TEST_F(PtzHeadTest, AModelWithoutToursHasNoSettingsOfThem) {
  PtzProfile profile = dome();
  profile.tours = profile.shadow_tours = 0;
  PtzHead head(profile, start_, 1);
  for (const char* query : {"Tour=off", "STour=off", "STour=off&STourA=off&STourB=off&STourC=off&STourD=off",
                            "STourRecord=stop", "STourPreview=stop"}) {
    EXPECT_FALSE(head.command_presets(query_pairs(query), at(0))) << query;
  }
  EXPECT_EQ(head.preset_settings(at(0)), (PtzHead::Pairs{{"PresetNum", "0"}}));
}

TEST_F(PtzHeadTest, AShadowTourIsPlayedAsItWasRecorded) {
  record_a_tour();
  EXPECT_EQ(setting(25, "STourBRecordedTime"), "15") << "seconds begun";
  EXPECT_EQ(setting(25, "STourARecordedTime"), "none");
  std::map<double, PtzPlace> recorded;
  PtzHead twin(dome(), start_, 1);
  ASSERT_TRUE(twin.move({{"Move", "right,24"}}, {}, at(1)));
  for (const double time : {1.5, 2.0, 2.9}) recorded[time] = twin.place(at(time));
  ASSERT_TRUE(move(30, "AbsolutePanTilt=0000,0000,20"));
  ASSERT_TRUE(move(30, "AbsoluteZoom=0000"));
  ASSERT_TRUE(presets(60, "STour=on&STourA=off&STourB=on"));
  // It stands at the start already and waits a second there: the orders count from 61.
  for (const auto& [time, place] : recorded) EXPECT_EQ(head_.place(at(61 + time)), place) << time;
  EXPECT_EQ(head_.place(at(75.4))[2], 4000);
  const PtzPlace end = head_.place(at(75.4));
  EXPECT_EQ(head_.place(at(81))[0], 0) << "back at the start";
  bool ends_again = false;
  for (double time = 82; time < 100; time += 0.25) ends_again |= head_.place(at(time)) == end;
  EXPECT_TRUE(ends_again) << "and once more";
}

TEST_F(PtzHeadTest, APreviewPlaysOnce) {
  record_a_tour();
  const PtzPlace end = head_.place(at(30));
  ASSERT_TRUE(move(30, "AbsolutePanTilt=1000,0000,20"));
  ASSERT_TRUE(presets(60, "STourPreview=B"));
  EXPECT_EQ(head_.place(at(100)), end);
  EXPECT_EQ(head_.place(at(10000)), end);
  EXPECT_EQ(setting(10000, "STour"), "off");
}

TEST_F(PtzHeadTest, APreviewCanBeStopped) {
  record_a_tour();
  ASSERT_TRUE(presets(60, "STourPreview=B"));
  ASSERT_TRUE(presets(61, "STourPreview=stop"));
  const PtzPlace place = head_.place(at(63));
  EXPECT_EQ(head_.place(at(500)), place);
  EXPECT_TRUE(presets(500, "STourPreview=stop")) << "there is none";
  EXPECT_TRUE(presets(500, "STourRecord=stop")) << "likewise";
}

TEST_F(PtzHeadTest, ARecordingEndsAtItsLongestTime) {
  ASSERT_TRUE(presets(0, "STourRecord=A"));
  ASSERT_TRUE(move(10, "Move=right,3"));
  EXPECT_EQ(setting(59, "STourARecordedTime"), "none");
  EXPECT_EQ(setting(61, "STourARecordedTime"), "60");
  ASSERT_TRUE(presets(100, "STourRecord=stop"));
  EXPECT_EQ(setting(100, "STourARecordedTime"), "60");
}

TEST_F(PtzHeadTest, OfBothKindsOfToursTheOneSwitchedOnLastRuns) {
  set_three_presets();
  ASSERT_TRUE(presets(100, "STourRecord=A"));
  ASSERT_TRUE(presets(101, "STourRecord=stop"));
  ASSERT_TRUE(presets(102, "Tour=on&TourA=on&TourASequence=1,3&TourAStaytime=10"));
  ASSERT_TRUE(presets(110, "STour=on&STourA=on"));
  EXPECT_EQ(setting(110, "Tour"), "off");
  EXPECT_EQ(pan(130), 1000) << "the shadow tour stands where it was recorded";
  ASSERT_TRUE(presets(130, "Tour=on"));
  EXPECT_EQ(setting(130, "STour"), "off");
  EXPECT_EQ(pan(135), -1000);
}

TEST_F(PtzHeadTest, SwitchingOffNamesFourShadowToursHoweverManyThereAre) {
  EXPECT_TRUE(presets(0, "STour=off&STourA=off&STourB=off&STourC=off&STourD=off"));
}

TEST_F(PtzHeadTest, AShadowTourWithoutARecordingRests) {
  ASSERT_TRUE(presets(0, "STour=on&STourA=on&STourB=off"));
  EXPECT_EQ(head_.pose(false, at(1e6)).user_data, "CamPos: 111000000000000S");
}

}  // namespace
}  // namespace vexa::camera
