// SPDX-License-Identifier: Apache-2.0
#include "host/recording/recording_meter.h"

#include <gtest/gtest.h>

namespace vexa::host {
namespace {

using std::chrono::milliseconds;

RecordingMeter::Clock::time_point at(int ms) { return RecordingMeter::Clock::time_point{} + milliseconds(ms); }

TEST(RecordingMeter, StartsEmpty) {
  RecordingMeter meter;
  meter.set_camera_rate(25);
  EXPECT_EQ(meter.frames(), 0u);
  EXPECT_EQ(meter.elapsed(at(5000)).count(), 0);
  EXPECT_EQ(meter.recent_bit_rate(at(5000)), 0);
  EXPECT_EQ(meter.mean_bit_rate(), 0);
  EXPECT_EQ(meter.expected_frames(at(5000)), 0u);
}

TEST(RecordingMeter, CountsPicturesKeyPicturesAndBytes) {
  RecordingMeter meter;
  meter.add(1000, true, at(100));
  meter.add(10, false, at(140));
  EXPECT_EQ(meter.frames(), 2u);
  EXPECT_EQ(meter.key_frames(), 1u);
  EXPECT_EQ(meter.bytes(), 1010u);
  EXPECT_DOUBLE_EQ(meter.elapsed(at(1100)).count(), 1.0);
}

TEST(RecordingMeter, MeansBitRateLeavesOutThePictureWhoseTimeHasNotPassed) {
  RecordingMeter meter;
  for (int i = 0; i <= 25; ++i) meter.add(1000, i == 0, at(i * 40));
  EXPECT_DOUBLE_EQ(meter.mean_bit_rate(), 25 * 1000 * 8);
}

TEST(RecordingMeter, RecentBitRateLooksTwoSecondsBack) {
  RecordingMeter meter;
  meter.add(1000000, true, at(0));
  for (int i = 1; i <= 100; ++i) meter.add(1000, false, at(i * 40));
  EXPECT_NEAR(meter.recent_bit_rate(at(4000)), 25 * 1000 * 8, 1000 * 8);
  EXPECT_EQ(meter.recent_bit_rate(at(7000)), 0);
}

TEST(RecordingMeter, EstimatesMissingPicturesByTheStatedRate) {
  RecordingMeter meter;
  meter.set_camera_rate(25);
  for (int i = 0; i <= 50; ++i) {
    if (i < 10 || i >= 25) meter.add(1000, i == 25, at(i * 40 + i % 3));
  }
  EXPECT_EQ(meter.expected_frames(at(2000)), 51u);
  EXPECT_EQ(meter.missing_frames(at(2000)), 15u);
}

TEST(RecordingMeter, PicturesThatStayAwayAtTheEndAreMissingToo) {
  RecordingMeter meter;
  meter.set_camera_rate(25);
  for (int i = 0; i < 25; ++i) meter.add(1000, i == 0, at(i * 40));
  EXPECT_EQ(meter.missing_frames(at(960)), 0u);
  EXPECT_EQ(meter.missing_frames(at(1000)), 0u);
  EXPECT_EQ(meter.missing_frames(at(1039)), 0u);
  EXPECT_EQ(meter.missing_frames(at(1041)), 1u);
  EXPECT_EQ(meter.missing_frames(at(10001)), 225u);
}

TEST(RecordingMeter, ACameraFasterThanItsSettingMissesNoPicture) {
  RecordingMeter meter;
  meter.set_camera_rate(25);
  for (int i = 0; i <= 50; ++i) meter.add(1000, false, at(i * 20));
  EXPECT_EQ(meter.missing_frames(at(1000)), 0u);
}

TEST(RecordingMeter, TheStreamsOwnRateCountsMoreThanTheCameras) {
  RecordingMeter meter;
  EXPECT_EQ(meter.stated_rate(), 0);
  EXPECT_FALSE(meter.expected_frames(at(0)));
  EXPECT_FALSE(meter.missing_frames(at(0)));
  meter.set_camera_rate(25);
  EXPECT_EQ(meter.stated_rate(), 25);
  meter.set_stream({1920, 1080, 0});
  EXPECT_EQ(meter.stated_rate(), 25);
  meter.set_stream({1920, 1080, 12.5});
  EXPECT_EQ(meter.stated_rate(), 12.5);
}

}  // namespace
}  // namespace vexa::host
