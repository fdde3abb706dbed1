// SPDX-License-Identifier: Apache-2.0
#include "host/recording/recorder.h"

#include <gtest/gtest.h>

#include <deque>

#include "host/recording/frame_file.h"
#include "tests/support/temporary_folder.h"

namespace vexa::host {
namespace {

using vexa_test::contents_of;
using vexa_test::TemporaryFolder;

struct Answer {
  ELibDReturnCode result;
  std::int32_t frame_type = VIDEO_FRAME_INVALID;
  std::string bytes = "";
  std::int32_t seconds = 0;
  std::int32_t microseconds = 0;
};

// A device that answers polls from a list, a millisecond each, and then never has a frame again.
class ScriptedDevice final : public CLibraryDevice {
 public:
  explicit ScriptedDevice(std::deque<Answer> answers) : answers_(std::move(answers)) {}

  ELibDReturnCode GetCurrentVideoFrame(SLibDVideoFrameInfo& frame) override {
    now_ += std::chrono::milliseconds(1);
    if (answers_.empty()) return LIBD_NO_FRAME;
    const Answer answer = answers_.front();
    answers_.pop_front();
    frame.frameType = answer.frame_type;
    frame.seconds = answer.seconds;
    frame.microseconds = answer.microseconds;
    if (answer.result == LIBD_OK) {
      const std::vector<unsigned char> bytes(answer.bytes.begin(), answer.bytes.end());
      frame.sink->Write(bytes.data(), static_cast<unsigned int>(bytes.size()));
    }
    return answer.result;
  }

  [[nodiscard]] Recorder::Clock::time_point now() const { return now_; }

 private:
  std::deque<Answer> answers_;
  Recorder::Clock::time_point now_{};
};

const Answer kKey{LIBD_OK, VIDEO_FRAME_H264_KEY, "K"};
const Answer kDelta{LIBD_OK, VIDEO_FRAME_H264_DELTA, "d"};
const Answer kNothing{LIBD_NO_FRAME};

struct Outcome {
  RecordingEnd end;
  std::string file;
};

Outcome record(std::deque<Answer> answers, RecordingLimits limits) {
  const TemporaryFolder folder;
  ScriptedDevice device(std::move(answers));
  limits.now = [&device] { return device.now(); };
  FrameFile file(folder / "live");
  Recorder recorder(device, file, limits);
  const RecordingEnd end = recorder.run([](const RecordingMeter&, Recorder::Clock::time_point) {});
  EXPECT_FALSE(file.close());
  return {end, contents_of(folder / "live")};
}

// Keeps what it is given.
class Kept final : public PictureTarget {
 public:
  [[nodiscard]] std::optional<Problem> check() const override { return std::nullopt; }
  [[nodiscard]] std::optional<Problem> write(const RecordedPicture& picture) override {
    keys.push_back(picture.key);
    times.push_back(picture.time);
    return std::nullopt;
  }
  [[nodiscard]] std::optional<Problem> close() override { return std::nullopt; }
  [[nodiscard]] const std::string& path() const override { return name; }

  const std::string name;
  std::vector<bool> keys;
  std::vector<std::chrono::microseconds> times;
};

TEST(Recorder, KeepsTheTimesThatTheDriverGives) {
  ScriptedDevice device({{LIBD_OK, VIDEO_FRAME_MPEG4_KEY, "K", 1700000000, 250000},
                         {LIBD_OK, VIDEO_FRAME_MPEG4_DELTA, "d", 1700000000, 290001}});
  Kept kept;
  Recorder recorder(device, kept, {.frames = 2, .now = [&device] { return device.now(); }});
  EXPECT_EQ(recorder.run([](const RecordingMeter&, Recorder::Clock::time_point) {}), RecordingEnd::kComplete);
  EXPECT_EQ(kept.times, (std::vector<std::chrono::microseconds>{std::chrono::microseconds(1700000000250000),
                                                                std::chrono::microseconds(1700000000290001)}));
  EXPECT_EQ(kept.keys, (std::vector<bool>{true, false}));
}

TEST(Recorder, PicturesWithoutATimeGetTheOneWhenTheyCame) {
  ScriptedDevice device({{LIBD_OK, VIDEO_FRAME_JPEG, "a"}, kNothing, kNothing, {LIBD_OK, VIDEO_FRAME_JPEG, "b"}});
  Kept kept;
  Recorder recorder(device, kept, {.frames = 2, .now = [&device] { return device.now(); }});
  EXPECT_EQ(recorder.run([](const RecordingMeter&, Recorder::Clock::time_point) {}), RecordingEnd::kComplete);
  ASSERT_EQ(kept.times.size(), 2U);
  EXPECT_EQ(kept.times[1] - kept.times[0], std::chrono::milliseconds(3));
  EXPECT_EQ(kept.keys, (std::vector<bool>{true, true}));
}

TEST(Recorder, BeginsWithTheFirstKeyPicture) {
  const Outcome outcome = record({kDelta, kNothing, kDelta, kKey, kDelta, kNothing, kDelta}, {.frames = 3});
  EXPECT_EQ(outcome.end, RecordingEnd::kComplete);
  EXPECT_EQ(outcome.file, "Kdd");
}

TEST(Recorder, EndsAtTheFrameLimitWithoutTakingMore) {
  const Outcome outcome = record({kKey, kDelta, kDelta, kDelta}, {.frames = 2});
  EXPECT_EQ(outcome.end, RecordingEnd::kComplete);
  EXPECT_EQ(outcome.file, "Kd");
}

TEST(Recorder, CountsSecondsFromTheFirstPicture) {
  const Outcome outcome =
      record({kNothing, kNothing, kNothing, kNothing, kKey, kDelta, kDelta, kDelta}, {.seconds = 0.002});
  EXPECT_EQ(outcome.end, RecordingEnd::kComplete);
  EXPECT_EQ(outcome.file, "Kdd");
}

TEST(Recorder, EndsAtTheTimeLimitWhenNoPictureComesAnyMore) {
  const Outcome outcome = record({kKey}, {.seconds = 0.005});
  EXPECT_EQ(outcome.end, RecordingEnd::kComplete);
  EXPECT_EQ(outcome.file, "K");
}

TEST(Recorder, ASilentCameraEndsTheRecording) {
  const Outcome outcome = record({kKey, {LIBD_TIMEOUT}, kDelta}, {});
  EXPECT_EQ(outcome.end, RecordingEnd::kSilent);
  EXPECT_EQ(outcome.file, "K");
}

TEST(Recorder, SilenceEndsTheRecordingWithoutWaitingForTheDriversWord) {
  const Outcome outcome =
      record({kKey, kNothing, kNothing, kNothing, kDelta}, {.silence = std::chrono::milliseconds(3)});
  EXPECT_EQ(outcome.end, RecordingEnd::kSilent);
  EXPECT_EQ(outcome.file, "Kd");
}

TEST(Recorder, ASilenceJustShortOfTheLimitDoesNotEndTheRecording) {
  std::deque<Answer> answers = {kKey, kNothing, kNothing, kDelta};
  EXPECT_EQ(record(answers, {.silence = std::chrono::milliseconds(3)}).file, "Kd");
  EXPECT_EQ(record(answers, {.silence = std::chrono::milliseconds(1)}).file, "K");
}

TEST(Recorder, GivesUpWithoutAKeyPicture) {
  std::deque<Answer> deltas(2000, kDelta);
  const Outcome outcome = record(std::move(deltas), {.first_picture = std::chrono::seconds(1)});
  EXPECT_EQ(outcome.end, RecordingEnd::kNoKeyPicture);
  EXPECT_EQ(outcome.file, "");
}

TEST(Recorder, AFileThatCannotBeWrittenEndsTheRecording) {
  ScriptedDevice device({kKey, kDelta});
  FrameFile file("/dev/full");
  Recorder recorder(device, file, {.now = [&device] { return device.now(); }});
  EXPECT_EQ(recorder.run([](const RecordingMeter&, Recorder::Clock::time_point) {}), RecordingEnd::kCannotWrite);
  ASSERT_TRUE(recorder.problem());
  EXPECT_EQ(recorder.problem()->code, ExitCode::kCannotWrite);
  EXPECT_EQ(recorder.meter().frames(), 0u);
}

}  // namespace
}  // namespace vexa::host
