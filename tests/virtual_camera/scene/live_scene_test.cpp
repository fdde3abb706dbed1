#include "virtual_camera/scene/live_scene.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "tests/virtual_camera/ptz/ptz_models.h"

namespace vexa::camera {
namespace {

constexpr std::chrono::steady_clock::time_point kBegin{std::chrono::hours(1)};

class SeenByACamera : public testing::Test {
 protected:
  SeenByACamera() {
    state_.pose = [this](std::chrono::steady_clock::time_point) { return pose_; };
    state_.settings.set("camera", "ImageSize1", "640,480");
  }
  // Ten seconds from the left edge of the picture to the right one.
  void walk() { state_.stage.enter(walk_through(main_view_of(state_, kBegin), std::chrono::seconds(10)), kBegin); }
  // The windows that are set off at a second of the walk, by their numbers.
  std::string windows_at(double second) {
    const auto moment = kBegin + std::chrono::milliseconds(static_cast<int>(second * 1000));
    std::string numbers;
    const auto seen = alarmed_windows(state_, moment);
    for (std::size_t i = 0; i < seen.size(); ++i) {
      if (seen[i]) numbers += std::to_string(i + 1);
    }
    return numbers;
  }

  asio::io_context context_;
  CameraState state_{CameraOptions{}, context_};
  CameraPose pose_{120, -30, 40, ""};
};

TEST_F(SeenByACamera, IsTheViewOfItsPoseInTheSizeOfItsFirstStream) {
  const View view = main_view_of(state_, kBegin);
  EXPECT_EQ(view.pose.pan, 120);
  EXPECT_EQ(view.size, (PictureSize{640, 480}));
  EXPECT_FALSE(view.rotated);
  state_.settings.set("camera", "Eflip", "on");
  EXPECT_TRUE(view_of(state_, {320, 192}, kBegin).rotated);
}

TEST_F(SeenByACamera, IsTheNorthForOneThatDoesNotKnowWhereItLooks) {
  state_.pose = nullptr;
  const View view = main_view_of(state_, kBegin);
  EXPECT_EQ(view.pose.pan, 0);
  EXPECT_EQ(view.pose.tilt, 0);
  EXPECT_EQ(view.pose.horizontal_angle, 60);
}

TEST_F(SeenByACamera, SizesThatCannotBeReadAreTheUsualOne) {
  for (const char* size : {"", "0,480", "640,-1", "x,y"}) {
    state_.settings.set("camera", "ImageSize1", size);
    EXPECT_EQ(main_view_of(state_, kBegin).size, (PictureSize{1920, 1080})) << size;
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
    state_.settings.set("camera", "Eflip", rotated ? "on" : "off");
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
  const SceneMoment moment = moment_of(state_, kBegin + std::chrono::seconds(5));
  ASSERT_TRUE(moment.intruder);
  EXPECT_NEAR(moment.intruder->bearing, 120, 1e-9);
}

class SeenByADome : public SeenByACamera {
 protected:
  SeenByADome() {
    state_.ptz = std::make_unique<PtzHead>(dome(), kBegin, 1);
    state_.pose = [this](PtzHead::Time now) { return state_.ptz->pose(false, now); };
  }
  // The head rests at `place` a minute after it is told, and a preset holds that place.
  void set_preset(const std::string& number, const std::string& place) {
    ASSERT_TRUE(state_.ptz->move({{"AbsolutePanTilt", place}}, {}, now_));
    now_ += std::chrono::minutes(1);
    ASSERT_TRUE(state_.ptz->command_presets({{"PresetSet", number + ",name,on"}}, now_));
  }
  std::string windows_now() {
    state_.stage.enter(walk_through(main_view_of(state_, now_), std::chrono::seconds(10)),
                       now_ - std::chrono::seconds(5));
    std::string numbers;
    for (const bool seen : alarmed_windows(state_, now_)) numbers += seen ? '1' : '0';
    return numbers;
  }

  PtzHead::Time now_ = kBegin;
};

TEST_F(SeenByADome, PresetsHaveFlagsWhereTheHeadLookedWhenTheyWereSet) {
  set_preset("1", "FC18,0640,20");
  const CameraPose first = state_.pose(now_);
  set_preset("3", "07D0,0000,20");
  const std::vector<PresetMark> marks = moment_of(state_, now_).presets;
  ASSERT_EQ(marks.size(), 2U);
  EXPECT_EQ(marks[0].number, 1);
  EXPECT_DOUBLE_EQ(marks[0].pan, first.pan);
  EXPECT_DOUBLE_EQ(marks[0].tilt, first.tilt);
  EXPECT_EQ(marks[1].number, 3);
  EXPECT_DOUBLE_EQ(marks[1].pan, state_.pose(now_).pan);
}

TEST_F(SeenByADome, WindowsAreThoseOfThePresetAtWhichItStandsWhereSettingsBelongToPresets) {
  ASSERT_TRUE(state_.settings.apply(
      "objectdetection", "Od99Win1=on&Od99Win1Area=0,0,10000,10000&Od02Win4=on&Od02Win4Area=0,0,10000,10000"));
  set_preset("2", "FC18,0640,20");
  EXPECT_EQ(windows_now(), "1000");
  state_.settings.set("objectdetection", "PositionMode", "preset");
  EXPECT_EQ(windows_now(), "0001");
  ASSERT_TRUE(state_.ptz->move({{"AbsolutePanTilt", "07D0,0000,20"}}, {}, now_));
  now_ += std::chrono::minutes(1);
  EXPECT_EQ(windows_now(), "0000") << "no preset is here";
}

TEST_F(SeenByACamera, WindowsOfTheSimplerKindOfDetectionAreOne) {
  state_.alarms.rearrange({2, "lod", true, true});
  walk();
  for (const double second : {1.0, 5.0, 9.0}) EXPECT_EQ(windows_at(second), "1") << second;
}

TEST_F(SeenByACamera, NobodyIsSeenThroughACoveredLensUntilItIsFree) {
  walk();
  state_.alarms.happen({AlarmEvent::Kind::kLens, 1, 1});
  EXPECT_EQ(windows_at(5), "");
  EXPECT_TRUE(moment_of(state_, kBegin).covered);
  state_.alarms.clear_tampering();
  EXPECT_TRUE(moment_of(state_, kBegin).covered) << "clearing the alarm frees no lens";
  state_.alarms.happen({AlarmEvent::Kind::kLens, 1, 0});
  EXPECT_EQ(windows_at(5), "23");
  EXPECT_FALSE(moment_of(state_, kBegin).covered);
}

TEST_F(SeenByACamera, NewWalkTakesThePlaceOfTheOneUnderWay) {
  walk();
  state_.stage.enter(walk_through(main_view_of(state_, kBegin), std::chrono::seconds(10)),
                     kBegin + std::chrono::seconds(4));
  EXPECT_EQ(windows_at(3), "");
  EXPECT_EQ(windows_at(9), "23");
  EXPECT_EQ(windows_at(15), "");
}

}  // namespace
}  // namespace vexa::camera
