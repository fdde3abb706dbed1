// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/scene/live_scene.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/virtual_camera/ptz/ptz_models.h"

namespace vexa::camera {
namespace {

constexpr std::chrono::steady_clock::time_point kBegin{std::chrono::hours(1)};

class SeenByACamera : public testing::Test {
 protected:
  SeenByACamera() { settings_.set("camera", "ImageSize1", "640,480"); }
  // Ten seconds from the left edge of the picture to the right one.
  void walk() { stage_.enter(walk_through(scene().main_view(kBegin), std::chrono::seconds(10)), kBegin); }
  // The windows that are set off at a second of the walk, by their numbers.
  std::string windows_at(double second) {
    const auto moment = kBegin + std::chrono::milliseconds(static_cast<int>(second * 1000));
    std::string numbers;
    const auto seen = scene().alarmed_windows(moment);
    for (std::size_t i = 0; i < seen.size(); ++i) {
      if (seen[i]) numbers += std::to_string(i + 1);
    }
    return numbers;
  }

  [[nodiscard]] virtual const LiveScene& scene() const { return scene_; }

  SettingsStore settings_;
  AlarmScene alarms_{AlarmLayout{}};
  SceneStage stage_;
  CameraPose pose_{120, -30, 40, ""};

 private:
  LiveScene scene_{settings_, alarms_, stage_, [this](LiveScene::Time) { return pose_; }, nullptr};
};

TEST_F(SeenByACamera, IsTheViewOfItsPoseInTheSizeOfItsFirstStream) {
  const View view = scene().main_view(kBegin);
  EXPECT_EQ(view.pose.pan, 120);
  EXPECT_EQ(view.size, (PictureSize{640, 480}));
  EXPECT_FALSE(view.rotated);
  settings_.set("camera", "Eflip", "on");
  EXPECT_TRUE(scene().view({320, 192}, kBegin).rotated);
}

TEST_F(SeenByACamera, IsTheNorthForOneThatDoesNotKnowWhereItLooks) {
  const View view = LiveScene(settings_, alarms_, stage_, nullptr, nullptr).main_view(kBegin);
  EXPECT_EQ(view.pose.pan, 0);
  EXPECT_EQ(view.pose.tilt, 0);
  EXPECT_EQ(view.pose.horizontal_angle, 60);
}

TEST_F(SeenByACamera, SizesThatCannotBeReadAreTheUsualOne) {
  for (const char* size : {"", "0,480", "640,-1", "x,y"}) {
    settings_.set("camera", "ImageSize1", size);
    EXPECT_EQ(scene().main_view(kBegin).size, (PictureSize{1920, 1080})) << size;
  }
}

TEST_F(SeenByACamera, WindowsSetOffAsTheFigureCrossesThem) {
  walk();
  const struct {
    double second;
    const char* windows;
  } cases[] = {{-1, ""},  {0, ""},  {1.5, "1"}, {3, "12"},  {4, "2"},
               {5, "23"}, {6, "3"}, {7, "34"},  {8.5, "4"}, {11, ""}};
  for (const bool rotated : {false, true}) {
    settings_.set("camera", "Eflip", rotated ? "on" : "off");
    walk();
    for (const auto& c : cases) EXPECT_EQ(windows_at(c.second), c.windows) << c.second << " " << rotated;
  }
}

TEST_F(SeenByACamera, FigureStaysInItsPlaceWhileTheCameraTurns) {
  walk();
  ASSERT_EQ(windows_at(5), "23");
  pose_.pan += 10;  // a quarter of the picture
  EXPECT_EQ(windows_at(5), "12");
  pose_.pan = 300;
  EXPECT_EQ(windows_at(5), "");
  pose_.pan = 120;
  pose_.tilt = 30;
  EXPECT_EQ(windows_at(5), "");
}

TEST_F(SeenByACamera, ZoomBringsTheFigureIntoMoreWindows) {
  walk();
  pose_.horizontal_angle = 4;
  EXPECT_EQ(windows_at(5), "1234");
  const SceneMoment moment = scene().moment(kBegin + std::chrono::seconds(5));
  ASSERT_TRUE(moment.intruder);
  EXPECT_NEAR(moment.intruder->bearing, 120, 1e-9);
}

class SeenByADome : public SeenByACamera {
 protected:
  [[nodiscard]] const LiveScene& scene() const override { return scene_; }
  // The head rests at `place` a minute after the order, and a preset holds that place.
  void set_preset(const std::string& number, const std::string& place) {
    ASSERT_TRUE(ptz_.move({{"AbsolutePanTilt", place}}, {}, now_));
    now_ += std::chrono::minutes(1);
    ASSERT_TRUE(ptz_.command_presets({{"PresetSet", number + ",name,on"}}, now_));
  }
  std::string windows_now() {
    stage_.enter(walk_through(scene().main_view(now_), std::chrono::seconds(10)), now_ - std::chrono::seconds(5));
    std::string numbers;
    for (const bool seen : scene().alarmed_windows(now_)) numbers += seen ? '1' : '0';
    return numbers;
  }

  PtzHead::Time now_ = kBegin;
  PtzHead ptz_{dome(), kBegin, 1};

 private:
  LiveScene scene_{settings_, alarms_, stage_, [this](PtzHead::Time now) { return ptz_.pose(false, now); }, &ptz_};
};

TEST_F(SeenByADome, PresetsHaveFlagsWhereTheHeadLookedWhenTheyWereSet) {
  set_preset("1", "FC18,0640,20");
  const CameraPose first = ptz_.pose(false, now_);
  set_preset("3", "07D0,0000,20");
  const std::vector<PresetMark> marks = scene().moment(now_).presets;
  ASSERT_EQ(marks.size(), 2U);
  EXPECT_EQ(marks[0].number, 1);
  EXPECT_DOUBLE_EQ(marks[0].pan, first.pan);
  EXPECT_DOUBLE_EQ(marks[0].tilt, first.tilt);
  EXPECT_EQ(marks[1].number, 3);
  EXPECT_DOUBLE_EQ(marks[1].pan, ptz_.pose(false, now_).pan);
}

TEST_F(SeenByADome, WindowsAreThoseOfThePresetAtWhichItStandsWhereSettingsBelongToPresets) {
  ASSERT_TRUE(settings_.apply("objectdetection",
                              "Od99Win1=on&Od99Win1Area=0,0,10000,10000&Od02Win4=on&Od02Win4Area=0,0,10000,10000"));
  set_preset("2", "FC18,0640,20");
  EXPECT_EQ(windows_now(), "1000");
  settings_.set("objectdetection", "PositionMode", "preset");
  EXPECT_EQ(windows_now(), "0001");
  ASSERT_TRUE(ptz_.move({{"AbsolutePanTilt", "07D0,0000,20"}}, {}, now_));
  now_ += std::chrono::minutes(1);
  EXPECT_EQ(windows_now(), "0000") << "no preset is here";
}

TEST_F(SeenByACamera, WindowsOfTheSimplerKindOfDetectionAreOne) {
  alarms_.rearrange({2, "lod", true, true});
  walk();
  for (const double second : {1.0, 5.0, 9.0}) EXPECT_EQ(windows_at(second), "1") << second;
}

TEST_F(SeenByACamera, NobodyIsSeenThroughACoveredLensUntilItIsFree) {
  walk();
  alarms_.happen({AlarmEvent::Kind::kLens, 1, 1});
  EXPECT_EQ(windows_at(5), "");
  EXPECT_TRUE(scene().moment(kBegin).covered);
  alarms_.clear_tampering();
  EXPECT_TRUE(scene().moment(kBegin).covered) << "clearing the alarm frees no lens";
  alarms_.happen({AlarmEvent::Kind::kLens, 1, 0});
  EXPECT_EQ(windows_at(5), "23");
  EXPECT_FALSE(scene().moment(kBegin).covered);
}

TEST_F(SeenByACamera, NewWalkTakesThePlaceOfTheOneUnderWay) {
  walk();
  stage_.enter(walk_through(scene().main_view(kBegin), std::chrono::seconds(10)), kBegin + std::chrono::seconds(4));
  EXPECT_EQ(windows_at(3), "");
  EXPECT_EQ(windows_at(9), "23");
  EXPECT_EQ(windows_at(15), "");
}

}  // namespace
}  // namespace vexa::camera
