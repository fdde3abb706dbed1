// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/scene/detection_windows.h"

#include <gtest/gtest.h>

namespace vexa::camera {
namespace {

using Seen = std::array<bool, kDetectionWindows>;

struct WatchedAreas {
  explicit WatchedAreas(std::string_view query) { EXPECT_TRUE(settings.apply("objectdetection", query)); }
  [[nodiscard]] Seen seen(const PictureBox& figure, int number = kPresentView) const {
    return windows_with(figure, detection_setting(settings, number, {1000, 500}));
  }

  SettingsStore settings;
};

TEST(DetectionWindows, AreTheQuartersOfThePictureBeforeTheyAreSet) {
  const WatchedAreas areas("PositionMode=current");
  const struct {
    PictureBox figure;
    Seen seen;
  } cases[] = {
      {{-500, 4000, 0, 6000}, {false, false, false, false}},  {{-500, 4000, 1, 6000}, {true, false, false, false}},
      {{2400, 4000, 2600, 6000}, {true, true, false, false}}, {{2500, 0, 2600, 1}, {false, true, false, false}},
      {{5100, 0, 7400, 9999}, {false, false, true, false}},   {{9999, 0, 12000, 10}, {false, false, false, true}},
      {{10000, 0, 12000, 10}, {false, false, false, false}},  {{100, -50, 200, 0}, {false, false, false, false}}};
  for (const auto& c : cases) EXPECT_EQ(areas.seen(c.figure), c.seen) << c.figure.left << " " << c.figure.right;
}

TEST(DetectionWindows, AreTheAreasOfTheSettingWithCornersInAnyOrder) {
  const WatchedAreas areas(
      "Od99Win1=on&Od99Win1Area=3000,3000,1000,1000&Od99Win1Mode=det&Od99Win2=off&Od99Win2Area=0,0,10000,10000"
      "&Od99Win3=on&Od99Win3Area=2000,5000,9000,2000");
  EXPECT_EQ(areas.seen({2500, 2500, 2600, 2600}), (Seen{true, false, true, false}));
  EXPECT_EQ(areas.seen({1000, 1000, 1100, 1100}), (Seen{true, false, false, false}));
  EXPECT_EQ(areas.seen({3000, 3000, 3100, 3100}), (Seen{false, false, true, false}));
  EXPECT_EQ(areas.seen({0, 0, 1000, 1000}), (Seen{false, false, false, false}));
}

TEST(DetectionWindows, OfAnotherNumberDoNotCount) {
  const WatchedAreas areas("Od07Win1=on&Od07Win1Area=0,0,100,100&Od8Win2=on&Od8Win2Area=0,0,100,100&Od99Win4=off");
  const PictureBox figure{0, 0, 50, 50};
  EXPECT_EQ(areas.seen(figure), (Seen{false, false, false, false}));
  EXPECT_EQ(areas.seen(figure, 7), (Seen{true, false, false, false}));
  EXPECT_EQ(areas.seen(figure, 8), (Seen{false, true, false, false}));
}

TEST(DetectionWindows, WithoutAnAreaThatCanBeReadAreOff) {
  for (const char* area :
       {"", "Od99Win1Area=&", "Od99Win1Area=0,0,9000&", "Od99Win1Area=0,0,9000,9000,1&", "Od99Win1Area=0,0,9000,x&",
        "Od99Win1Area=0 0 9000 9000&", "Od99Win1Area=0,0,9000,99999999999&"}) {
    const WatchedAreas areas(std::string(area) + "Od99Win1=on");
    EXPECT_EQ(areas.seen({0, 0, 50, 50}), (Seen{false, false, false, false})) << area;
  }
}

TEST(DetectionWindows, SeeNothingUnderAMask) {
  const WatchedAreas areas(
      "Od99Win1=on&Od99Win1Area=0,0,10000,10000&Od99Win1Mode=det&Od99Win2=on&Od99Win2Area=2000,0,4000,10000"
      "&Od99Win2Mode=mask&Od99Win3=on&Od99Win3Area=4000,0,6000,5000&Od99Win3Mode=mask");
  const struct {
    PictureBox figure;
    bool seen;
  } cases[] = {{{2500, 1000, 3500, 2000}, false}, {{1999, 1000, 3500, 2000}, true}, {{2000, 1000, 6000, 5000}, false},
               {{2000, 1000, 6000, 5001}, true},  {{2000, 1000, 6001, 5000}, true}, {{0, 0, 10000, 10000}, true},
               {{2000, -900, 6000, 5000}, false}, {{4000, 5000, 4001, 5001}, true}};
  for (const auto& c : cases) {
    EXPECT_EQ(areas.seen(c.figure), (Seen{c.seen, false, false, false})) << c.figure.left << " " << c.figure.bottom;
  }
}

TEST(DetectionWindows, TwoMasksMayHideWhatNeitherHidesAlone) {
  const WatchedAreas areas(
      "Od99Win1=on&Od99Win1Area=0,0,10000,10000&Od99Win2=on&Od99Win2Area=0,0,500,10000&Od99Win2Mode=mask"
      "&Od99Win3=on&Od99Win3Area=500,0,1000,10000&Od99Win3Mode=mask");
  EXPECT_EQ(areas.seen({0, 0, 1000, 1000}), (Seen{false, false, false, false}));
  EXPECT_EQ(areas.seen({0, 0, 1001, 1000}), (Seen{true, false, false, false}));
}

TEST(DetectionWindows, ReportFiguresOfTheSizeInPixelsAskedForAlone) {
  const WatchedAreas areas("Od99MinObjectSize=10,10&Od99MaxObjectSize=30,20");
  const struct {
    double width;
    double height;
    bool seen;
  } cases[] = {{99, 200, false}, {100, 199, false}, {100, 200, true},
               {300, 400, true}, {301, 400, false}, {300, 401, false}};
  for (const auto& c : cases) EXPECT_EQ(areas.seen({0, 0, c.width, c.height})[0], c.seen) << c.width << " " << c.height;
}

TEST(DetectionWindows, WithALargestSizeOfZeroHaveNone) {
  const WatchedAreas areas("Od99MinObjectSize=0,0&Od99MaxObjectSize=0,0");
  EXPECT_TRUE(areas.seen({0, 0, 9000, 9000})[0]);
}

TEST(DetectionWindows, OfTheSimplerKindAreTheWholePicture) {
  const DetectionSetting setting = whole_picture();
  EXPECT_EQ(windows_with({9990, 9990, 11000, 11000}, setting), (Seen{true, false, false, false}));
  EXPECT_EQ(windows_with({10000, 0, 11000, 9000}, setting), (Seen{false, false, false, false}));
}

}  // namespace
}  // namespace vexa::camera
