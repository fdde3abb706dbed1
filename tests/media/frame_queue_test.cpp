// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <stdexcept>

#include "tests/media/media_driver.h"
#include "tests/support/failing_new.h"

namespace vexa_test {
namespace {

std::time_t frame_clock_now = 1000;

class FrameQueue : public testing::Test {
 protected:
  FrameQueue() {
    driver_.state().now = [] { return frame_clock_now; };
    frame_clock_now = 1000;
    driver_.m_LastFrameTime = 1000;
    driver_.use("127.0.0.1", 1, 5000);
  }

  /// What the streaming thread does with a frame of `type` whose one byte is `mark`.
  void process(std::int32_t type, ELibDReturnCode result, char mark = 'x') {
    CVexaCommon::VideoFrameInfo frame;
    frame.capacity = 8;
    frame.data = new unsigned char[frame.capacity];
    frame.data[0] = static_cast<unsigned char>(mark);
    frame.length = 1;
    frame.frameType = type;
    MediaDriver::ProcessCurrentFrameData(&driver_, frame, wait_key_, result);
    EXPECT_EQ(frame.data, nullptr) << "the frame is the queue's, or freed";
  }

  std::string marks() {
    std::string all;
    FrameTaker host;
    TakenFrame frame;
    while (host.take(driver_, frame) == LIBD_OK) all += frame.bytes;
    return all;
  }

  MediaDriver driver_;
  bool wait_key_ = false;
};

struct ResultCase {
  ELibDReturnCode result;
  bool timed_out_before;
  std::time_t silence;  // seconds since the last frame; the time-out is 5
  bool timed_out_after;
  std::size_t queued;
  bool large_buffers;
};

TEST_F(FrameQueue, EveryResultHasItsEffectOnTimeOutQueueAndBuffers) {
  const ResultCase cases[] = {
      {LIBD_OK, true, 0, false, 1, false},          {LIBD_FRAME_DAMAGED, true, 0, false, 1, false},
      {LIBD_NO_FRAME, true, 9, false, 0, false},    {LIBD_BUFFER_TOO_SMALL, true, 0, false, 0, true},
      {LIBD_FAILED, true, 5, false, 0, false},      {LIBD_FAILED, false, 6, true, 0, false},
      {LIBD_TIMEOUT, false, 0, true, 0, false},     {LIBD_UNAUTHORIZED, false, 9, false, 0, false},
      {LIBD_UNAUTHORIZED, true, 0, true, 0, false}, {LIBD_INVALID_MODE, true, 0, true, 0, false},
  };
  for (const ResultCase& c : cases) {
    driver_.m_VideoTimedOut = c.timed_out_before;
    driver_.m_LargeFrameBuffers = false;
    frame_clock_now = driver_.m_LastFrameTime + c.silence;
    process(VIDEO_FRAME_JPEG, c.result);
    EXPECT_EQ(driver_.m_VideoTimedOut, c.timed_out_after) << c.result;
    EXPECT_EQ(driver_.m_FrameQueue.size(), c.queued) << c.result;
    EXPECT_EQ(driver_.m_LargeFrameBuffers, c.large_buffers) << c.result;
    driver_.state().clear_frame_queue();
  }
}

TEST_F(FrameQueue, WithTenJpegFramesWaitingTheNextRemovesTheOldest) {
  for (char mark = 'a'; mark < 'a' + 10; ++mark) process(VIDEO_FRAME_JPEG, LIBD_OK, mark);
  process(VIDEO_FRAME_JPEG, LIBD_OK, 'z');
  EXPECT_EQ(marks(), "bcdefghijz");
}

TEST_F(FrameQueue, WithThirtyOneH264FramesWaitingTheNextDeltaEmptiesTheQueueUntilAKeyFrame) {
  process(VIDEO_FRAME_H264_KEY, LIBD_OK, 'k');
  for (int i = 0; i < 30; ++i) process(VIDEO_FRAME_H264_DELTA, LIBD_OK, 'd');
  EXPECT_EQ(driver_.m_FrameQueue.size(), 31u);
  process(VIDEO_FRAME_H264_DELTA, LIBD_OK, 'x');
  EXPECT_EQ(driver_.m_FrameQueue.size(), 0u);
  process(VIDEO_FRAME_H264_DELTA, LIBD_OK, 'y');
  process(VIDEO_FRAME_H264_KEY, LIBD_OK, 'K');
  process(VIDEO_FRAME_H264_DELTA, LIBD_OK, 'D');
  EXPECT_EQ(marks(), "KD");
}

TEST_F(FrameQueue, AFrameWithoutATypeIsNeverHandedOutAndAKeyFrameMustFollow) {
  process(VIDEO_FRAME_INVALID, LIBD_OK, 'i');
  process(VIDEO_FRAME_H264_DELTA, LIBD_OK, 'd');
  process(VIDEO_FRAME_H264_KEY, LIBD_OK, 'k');
  EXPECT_EQ(marks(), "k");
}

TEST_F(FrameQueue, AnEmptyQueueGivesNoFrameAndATimeOutOnce) {
  SLibDVideoFrameInfo frame;
  EXPECT_EQ(driver_.GetCurrentVideoFrame(frame), LIBD_NO_FRAME);
  process(VIDEO_FRAME_JPEG, LIBD_TIMEOUT);
  EXPECT_EQ(driver_.GetCurrentVideoFrame(frame), LIBD_TIMEOUT);
  EXPECT_EQ(driver_.GetCurrentVideoFrame(frame), LIBD_NO_FRAME);
}

TEST_F(FrameQueue, TheHostGetsTypeAndTimeStampOfTheOldestFrame) {
  CVexaCommon::VideoFrameInfo queued;
  queued.capacity = queued.length = 3;
  queued.data = new unsigned char[3]{'a', 'b', 'c'};
  queued.frameType = VIDEO_FRAME_H264_KEY;
  queued.seconds = 1706745599;
  queued.microseconds = 250000;
  MediaDriver::PropulateFrameInfoList(&driver_, queued, wait_key_);
  TakenFrame frame;
  ASSERT_EQ(FrameTaker().take(driver_, frame), LIBD_OK);
  EXPECT_EQ(frame.bytes, "abc");
  EXPECT_EQ(frame.info.frameType, VIDEO_FRAME_H264_KEY);
  EXPECT_EQ(frame.info.seconds, 1706745599);
  EXPECT_EQ(frame.info.microseconds, 250000);
}

TEST_F(FrameQueue, AFrameForAHostWithoutASinkIsTakenAllTheSame) {
  process(VIDEO_FRAME_JPEG, LIBD_OK);
  SLibDVideoFrameInfo frame;
  EXPECT_EQ(driver_.GetCurrentVideoFrame(frame), LIBD_OK);
  EXPECT_EQ(driver_.GetCurrentVideoFrame(frame), LIBD_NO_FRAME);
}

struct ShortMemoryCase {
  std::int32_t type;
  bool waits_for_key;
};

TEST_F(FrameQueue, AFrameThatFindsNoMemoryInTheQueueIsFreedAsATimeOut) {
  for (const ShortMemoryCase& c :
       {ShortMemoryCase{VIDEO_FRAME_JPEG, false}, ShortMemoryCase{VIDEO_FRAME_H264_DELTA, true},
        ShortMemoryCase{VIDEO_FRAME_MPEG4_KEY, true}}) {
    wait_key_ = false;
    bool failed = false;
    for (int i = 0; i < 1000 && !failed; ++i) {  // the queue fetches memory for several frames at a time
      CVexaCommon::VideoFrameInfo frame;
      frame.capacity = 8;
      frame.data = new unsigned char[frame.capacity];
      frame.frameType = c.type;
      const std::size_t waiting = driver_.m_FrameQueue.size();
      const AllocationFailure failure(0);
      MediaDriver::ProcessCurrentFrameData(&driver_, frame, wait_key_, LIBD_OK);
      failed = failure.happened();
      EXPECT_EQ(frame.data, nullptr);
      EXPECT_TRUE(!failed || driver_.m_FrameQueue.size() <= waiting);
      EXPECT_EQ(driver_.m_VideoTimedOut, failed);
    }
    EXPECT_TRUE(failed) << c.type;
    EXPECT_EQ(wait_key_, c.waits_for_key) << c.type;
    driver_.state().clear_frame_queue();
  }
}

class ThrowingSink : public CDataSink {
 public:
  void Write(const unsigned char*, unsigned int) override { throw std::runtime_error("disk full"); }
};

TEST_F(FrameQueue, AThrowingSinkLeavesTheFrameQueuedAndTheLockFree) {
  process(VIDEO_FRAME_JPEG, LIBD_OK, 'j');
  ThrowingSink sink;
  SLibDVideoFrameInfo frame;
  frame.sink = &sink;
  EXPECT_THROW(driver_.GetCurrentVideoFrame(frame), std::runtime_error);
  std::string taken;
  std::thread([&] { taken = marks(); }).join();
  EXPECT_EQ(taken, "j");
}

}  // namespace
}  // namespace vexa_test
