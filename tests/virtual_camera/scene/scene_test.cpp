#include "virtual_camera/scene/scene.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <limits>
#include <vector>

namespace vexa::camera {
namespace {

constexpr PictureSize kSize{640, 360};

View looking(double pan, double tilt, double angle, bool rotated = false) {
  return {{pan, tilt, angle, ""}, kSize, rotated};
}

I420Picture rendered(const View& view, const SceneMoment& moment = {}) {
  I420Picture picture;
  render(view, moment, picture);
  return picture;
}

struct Found {
  int left = std::numeric_limits<int>::max();
  int right = -1;
  int top = std::numeric_limits<int>::max();
  int bottom = -1;
  int pixels = 0;
};

Found find_colour(const I420Picture& picture, Colour colour) {
  Found found;
  for (int row = 0; row < picture.height(); ++row) {
    for (int column = 0; column < picture.width(); ++column) {
      if (picture.at(column, row) != colour) continue;
      found.left = std::min(found.left, column);
      found.right = std::max(found.right, column);
      found.top = std::min(found.top, row);
      found.bottom = std::max(found.bottom, row);
      ++found.pixels;
    }
  }
  return found;
}

// Within a pixel of where it belongs.
void expect_flag_at(const I420Picture& picture, double column, double row, bool rotated) {
  const Found flag = find_colour(picture, kFlag);
  ASSERT_GT(flag.pixels, 0);
  EXPECT_NEAR(rotated ? flag.right : flag.left, column, 1.5);
  EXPECT_NEAR(rotated ? flag.top : flag.bottom, row, 1.5);
}

TEST(Scene, ShowsAPresetsFlagWhereItsPlaceFalls) {
  const struct {
    View view;
    PresetMark mark;
  } cases[] = {{looking(0, 0, 60), {1, 10, -5}},        {looking(45, 0, 60), {2, 30, 3}},
               {looking(355, -30, 20), {3, 2, -31}},    {looking(180, 12, 3), {17, 179, 11.5}},
               {looking(0, 0, 60, true), {4, 10, -5}},  {looking(355, -30, 20, true), {5, 2, -31}},
               {looking(90, -60, 120), {256, 60, -70}}, {looking(-725, -60, 120, true), {7, 0, -70}}};
  for (const auto& c : cases) {
    SCOPED_TRACE(c.mark.number);
    SceneMoment moment;
    moment.presets = {c.mark};
    const Projection projection(c.view);
    expect_flag_at(rendered(c.view, moment), projection.column(c.mark.pan), projection.row(c.mark.tilt),
                   c.view.rotated);
  }
}

TEST(Scene, ShowsTheNorthPostUnderItsBearing) {
  for (const bool rotated : {false, true}) {
    for (const double pan : {0.0, 20.0, 340.0, 359.9, -10.0}) {
      const View view = looking(pan, -20, 60, rotated);
      const Found post = find_colour(rendered(view), kNorthPost);
      ASSERT_GT(post.pixels, kSize.height) << pan;
      EXPECT_NEAR((post.left + post.right + 1) / 2.0, Projection(view).column(0), 1.5) << pan;
    }
  }
}

TEST(Scene, ShowsNoNorthPostElsewhere) {
  EXPECT_EQ(find_colour(rendered(looking(90, 0, 60)), kNorthPost).pixels, 0);
  EXPECT_GT(find_colour(rendered(looking(90, 0, 60)), kOtherPost).pixels, 0);
}

TEST(Scene, TicksStandAtWholeDegrees) {
  const View view = looking(100.25, 0, 20);  // numbers every 5 degrees, ticks at every half
  const Projection projection(view);
  const I420Picture picture = rendered(view);
  const int above_horizon = static_cast<int>(projection.row(0)) - 2;
  std::vector<int> ticks;
  for (int column = 0; column < kSize.width; ++column) {
    if (picture.at(column, above_horizon).y == kScale.y) ticks.push_back(column);
  }
  ASSERT_EQ(ticks.size(), 40U);
  for (std::size_t i = 0; i < ticks.size(); ++i) {
    EXPECT_EQ(ticks[i], static_cast<int>(projection.column(90.5 + 0.5 * static_cast<double>(i)))) << i;
  }
}

TEST(Scene, TiltMovesThePictureUpAndDown) {
  const auto horizon = [](double tilt) {
    const I420Picture picture = rendered(looking(45, tilt, 60));
    int row = 0;
    while (row < picture.height() && picture.at(630, row).u != 118) ++row;  // the ground's colour
    return row;
  };
  EXPECT_NEAR(horizon(0), 180, 2);
  EXPECT_NEAR(horizon(10), 180 + 107, 2);
  EXPECT_NEAR(horizon(-10), 180 - 107, 2);
}

TEST(Scene, ZoomSpreadsMarksInProportion) {
  SceneMoment moment;
  moment.presets = {{1, 1, -1}};
  for (const double angle : {60.0, 30.0, 10.0, 4.0}) {
    const Found flag = find_colour(rendered(looking(0, 0, angle), moment), kFlag);
    EXPECT_NEAR(flag.left - 320, 640 / angle, 1.5) << angle;
  }
}

TEST(Scene, IntruderGrowsWithZoomAndFillsItsBox) {
  SceneMoment moment;
  moment.intruder = Intruder{2, -3, 5, 0};
  for (const bool rotated : {false, true}) {
    for (const double angle : {60.0, 20.0}) {
      const View view = looking(0, 0, angle, rotated);
      const Found figure = find_colour(rendered(view, moment), kFigure);
      const PictureBox box = box_of(*moment.intruder, view);
      EXPECT_NEAR(figure.left, box.left * 640 / 10000, 2) << angle;
      EXPECT_NEAR(figure.right, box.right * 640 / 10000, 2) << angle;
      EXPECT_NEAR(figure.top, box.top * 360 / 10000, 2) << angle;
      EXPECT_NEAR(figure.bottom, box.bottom * 360 / 10000, 2) << angle;
    }
  }
}

TEST(Scene, RotatedIsTheUprightPictureTurnedButForTheClock) {
  SceneMoment moment;
  moment.presets = {{3, 12, -7}, {44, -9, 6}};
  moment.intruder = Intruder{-5, -8, 6, 0.3};
  const I420Picture upright = rendered(looking(7, -4, 50), moment);
  const I420Picture rotated = rendered(looking(7, -4, 50, true), moment);
  constexpr int kClockRows = 12;
  for (int row = kClockRows; row < kSize.height - kClockRows; ++row) {
    for (int column = 0; column < kSize.width; ++column) {
      ASSERT_EQ(rotated.at(column, row), upright.at(kSize.width - 1 - column, kSize.height - 1 - row))
          << column << " " << row;
    }
  }
}

TEST(Scene, CoveredLensShowsTheClockAlone) {
  SceneMoment moment;
  moment.covered = true;
  moment.presets = {{1, 0, 0}};
  moment.intruder = Intruder{0, -5, 10, 0};
  const I420Picture picture = rendered(looking(0, 0, 60), moment);
  const auto bright = std::count_if(picture.y(), picture.y() + 640 * 360, [](std::uint8_t y) { return y > 30; });
  EXPECT_GT(bright, 50) << "the clock";
  EXPECT_LT(bright, 12 * 35);
  EXPECT_EQ(find_colour(picture, kFlag).pixels + find_colour(picture, kFigure).pixels, 0);
}

// The clock's letters as rows of dots.
std::vector<std::string> clock_dots(std::chrono::milliseconds clock) {
  SceneMoment moment;
  moment.covered = true;
  moment.clock = clock;
  const I420Picture picture = rendered(looking(0, 0, 60), moment);
  std::vector<std::string> rows;
  for (int row = 2; row < 9; ++row) {
    std::string dots;
    for (int column = 2; column < 2 + 12 * 6; ++column) dots += picture.at(column, row).y > 100 ? '#' : ' ';
    rows.push_back(dots);
  }
  return rows;
}

TEST(Scene, ClockTellsTheMomentToTheMillisecond) {
  EXPECT_EQ(clock_dots(std::chrono::milliseconds(12 * 3600000 + 34 * 60000 + 56 * 1000 + 789)),
            (std::vector<std::string>{"  #    ###        #####    #        #####   ##        #####  ###   ###  ",
                                      " ##   #   #  ##      #    ##   ##   #      #              # #   # #   # ",
                                      "  #       #  ##     #    # #   ##   ####  #              #  #   # #   # ",
                                      "  #      #           #  #  #            # ####          #    ###   #### ",
                                      "  #     #    ##       # #####  ##       # #   #        #    #   #     # ",
                                      "  #    #     ##   #   #    #   ##   #   # #   #  ##    #    #   #    #  ",
                                      " ###  #####        ###     #         ###   ###   ##    #     ###   ##   "}));
}

TEST(Scene, SameMomentGivesTheSamePictureAndTheNextAnother) {
  SceneMoment moment;
  moment.clock = std::chrono::milliseconds(1000);
  const I420Picture first = rendered(looking(3, 2, 30), moment);
  EXPECT_EQ(first.bytes(), rendered(looking(3, 2, 30), moment).bytes());
  moment.clock += std::chrono::milliseconds(1);
  EXPECT_NE(first.bytes(), rendered(looking(3, 2, 30), moment).bytes());
}

TEST(Scene, IsDrawnInAnySizeFromAnyPose) {
  const double extremes[] = {std::numeric_limits<double>::quiet_NaN(),
                             std::numeric_limits<double>::infinity(),
                             1e300,
                             -1e300,
                             90,
                             -90,
                             0,
                             0.001};
  SceneMoment moment;
  moment.presets = {{1, 1e300, -1e300}, {2, 0, 0}, {-2147483647, 0, 90}};
  I420Picture picture;
  for (const PictureSize size : {PictureSize{2, 2}, {16, 2000}, {319, 191}, {2, 360}}) {
    for (const double value : extremes) {
      for (const bool rotated : {false, true}) {
        moment.intruder = Intruder{value, value, value, value};
        render({{value, value, value, ""}, size, rotated}, moment, picture);
        EXPECT_EQ(picture.width(), (size.width + 1) / 2 * 2);
        EXPECT_EQ(picture.height(), (size.height + 1) / 2 * 2);
      }
    }
  }
}

TEST(ClockOf, CountsFromMidnight) {
  using std::chrono::system_clock;
  EXPECT_EQ(clock_of(system_clock::time_point()), std::chrono::milliseconds(0));
  EXPECT_EQ(clock_of(system_clock::time_point(std::chrono::hours(25))), std::chrono::milliseconds(3600000));
  EXPECT_EQ(clock_of(system_clock::time_point(std::chrono::milliseconds(-1))), std::chrono::milliseconds(86399999));
}

}  // namespace
}  // namespace vexa::camera
