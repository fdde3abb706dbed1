// SPDX-License-Identifier: Apache-2.0
#include "host/recording/gap_recording.h"

#include <gtest/gtest.h>

#include <string>

#include "host/recording/frame_file.h"
#include "tests/support/temporary_folder.h"
#include "vexa/video_info.h"

namespace vexa::host {
namespace {

using vexa_test::contents_of;
using vexa_test::TemporaryFolder;

constexpr std::int64_t kTime = 1706745599000000;  // 2024-01-31T23:59:59Z

class RecordingOfGaps : public testing::Test {
 protected:
  GapRecording recording() {
    return GapRecording(folder_ / "live.h264",
                        [](const std::string& path) { return std::make_unique<FrameFile>(path); });
  }
  static void picture(GapRecording& recording, char text, std::uint64_t gap, bool key, bool leads_in = false) {
    const auto byte = static_cast<unsigned char>(text);
    BackfillFrame frame;
    frame.frameType = key ? VIDEO_FRAME_H264_KEY : VIDEO_FRAME_H264_DELTA;
    frame.data = &byte;
    frame.length = 1;
    frame.gap = gap;
    frame.time = kTime + static_cast<std::int64_t>(gap) * 1000000;
    frame.isKey = key;
    frame.leadsIn = leads_in;
    recording.callbacks().frame(frame);
  }
  static void gap(GapRecording& recording, std::uint64_t number, GapState state) {
    Gap gap;
    gap.number = number;
    gap.state = state;
    recording.callbacks().gap(gap);
  }
  [[nodiscard]] std::string file(const std::string& name) const { return contents_of(folder_ / name); }

 private:
  TemporaryFolder folder_;
};

TEST_F(RecordingOfGaps, EachGapHasAFileNamedByItsFirstPicture) {
  GapRecording two = recording();
  for (const std::uint64_t number : {1U, 2U}) {
    picture(two, 'K', number, true);
    picture(two, 'd', number, false);
    gap(two, number, GapState::kRecovered);
  }
  EXPECT_EQ(file("live-gap-20240201T000000Z.h264"), "Kd");
  EXPECT_EQ(file("live-gap-20240201T000001Z.h264"), "Kd");
  EXPECT_FALSE(two.problem());
}

TEST_F(RecordingOfGaps, WhatLeadsInIsWrittenOnceAtTheBeginning) {
  GapRecording one = recording();
  picture(one, 'K', 1, true, true);
  picture(one, 'l', 1, false, true);
  picture(one, 'd', 1, false);
  picture(one, 'K', 1, true, true);  // the playback was begun again
  picture(one, 'e', 1, false);
  one.close();
  EXPECT_EQ(file("live-gap-20240201T000000Z.h264"), "Klde");
}

TEST_F(RecordingOfGaps, AGapWithoutPicturesHasNoFile) {
  GapRecording none = recording();
  gap(none, 1, GapState::kDue);
  gap(none, 1, GapState::kAbsent);
  EXPECT_EQ(none.ended().size(), 1U);
  EXPECT_EQ(none.take_ended().size(), 1U);
  EXPECT_TRUE(none.take_ended().empty()) << "they are taken once";
  gap(none, 2, GapState::kRefused);
  EXPECT_EQ(none.take_ended().at(0).state, GapState::kRefused);
  EXPECT_EQ(none.ended().size(), 2U);
}

TEST_F(RecordingOfGaps, ADiskThatIsFullIsReported) {
  GapRecording full("/dev/full", [](const std::string&) { return std::make_unique<FrameFile>("/dev/full"); });
  picture(full, 'K', 1, true);
  full.close();
  EXPECT_TRUE(full.problem());
}

TEST(GapNames, TheNameOfGapsIsTheRecordingsWithAWord) {
  const struct {
    const char* out;
    const char* name;
  } cases[] = {{"live.mkv", "live-gap.mkv"}, {"a/b.c/gate.mp4", "a/b.c/gate-gap.mp4"}, {"/x/live", "/x/live-gap"}};
  for (const auto& row : cases) EXPECT_EQ(name_of_gaps(row.out), row.name);
}

TEST(GapNames, EachStateHasAWord) {
  const char* const words[] = {"open", "due", "recovered", "partial", "absent", "overwritten", "refused"};
  for (std::int32_t state = 0; state < 7; ++state) {
    EXPECT_STREQ(word_of(static_cast<GapState>(state)), words[state]);
  }
}

}  // namespace
}  // namespace vexa::host
