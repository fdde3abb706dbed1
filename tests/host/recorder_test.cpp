#include "host/recorder.h"

#include <gtest/gtest.h>

#include <deque>

#include "tests/support/temporary_folder.h"

namespace vexa::host {
namespace {

using vexa_test::contents_of;
using vexa_test::TemporaryFolder;

struct Answer {
  ELibDReturnCode result;
  std::int32_t frame_type = VIDEO_FRAME_INVALID;
  std::string bytes = "";
};

// A device that answers polls as told, a millisecond each, and then has no frame for ever.
class ScriptedDevice final : public CLibraryDevice {
 public:
  explicit ScriptedDevice(std::deque<Answer> answers) : answers_(std::move(answers)) {}

  ELibDReturnCode GetCurrentVideoFrame(SLibDVideoFrameInfo& frame) override {
    now_ += std::chrono::milliseconds(1);
    if (answers_.empty()) return LIBD_NO_FRAME;
    const Answer answer = answers_.front();
    answers_.pop_front();
    frame.frameType = answer.frame_type;
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
