// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <stdexcept>

#include "tests/media/media_driver.h"
#include "tests/support/failing_new.h"

namespace vexa_test {
namespace {

class FrameQueue : public testing::Test {
 protected:
  std::string marks() {
    std::string all;
    FrameTaker host;
    TakenFrame frame;
    while (host.take(driver_, frame) == LIBD_OK) all += frame.bytes;
    return all;
  }

  FedDriver driver_;
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
    FedDriver::clock_now = driver_.m_LastFrameTime + c.silence;
    driver_.feed(c.result, VIDEO_FRAME_JPEG);
    EXPECT_EQ(driver_.m_VideoTimedOut, c.timed_out_after) << c.result;
    EXPECT_EQ(driver_.m_FrameQueue.size(), c.queued) << c.result;
    EXPECT_EQ(driver_.m_LargeFrameBuffers, c.large_buffers) << c.result;
    driver_.state().clear_frame_queue();
  }
}

TEST_F(FrameQueue, WithTenJpegFramesWaitingTheNextRemovesTheOldest) {
  for (char mark = 'a'; mark < 'a' + 10; ++mark) driver_.feed(LIBD_OK, VIDEO_FRAME_JPEG, mark);
  driver_.feed(LIBD_OK, VIDEO_FRAME_JPEG, 'z');
  EXPECT_EQ(marks(), "bcdefghijz");
}

TEST_F(FrameQueue, WithThirtyOneH264FramesWaitingTheNextDeltaEmptiesTheQueueUntilAKeyFrame) {
  driver_.feed(LIBD_OK, VIDEO_FRAME_H264_KEY, 'k');
  for (int i = 0; i < 30; ++i) driver_.feed(LIBD_OK, VIDEO_FRAME_H264_DELTA, 'd');
  EXPECT_EQ(driver_.m_FrameQueue.size(), 31u);
  driver_.feed(LIBD_OK, VIDEO_FRAME_H264_DELTA, 'x');
  EXPECT_EQ(driver_.m_FrameQueue.size(), 0u);
  driver_.feed(LIBD_OK, VIDEO_FRAME_H264_DELTA, 'y');
  driver_.feed(LIBD_OK, VIDEO_FRAME_H264_KEY, 'K');
  driver_.feed(LIBD_OK, VIDEO_FRAME_H264_DELTA, 'D');
  EXPECT_EQ(marks(), "KD");
}

TEST_F(FrameQueue, AFrameWithoutATypeIsNeverHandedOutAndAKeyFrameMustFollow) {
  driver_.feed(LIBD_OK, VIDEO_FRAME_INVALID, 'i');
  driver_.feed(LIBD_OK, VIDEO_FRAME_H264_DELTA, 'd');
  driver_.feed(LIBD_OK, VIDEO_FRAME_H264_KEY, 'k');
  EXPECT_EQ(marks(), "k");
}

TEST_F(FrameQueue, AnEmptyQueueGivesNoFrameAndATimeOutOnce) {
  SLibDVideoFrameInfo frame;
  EXPECT_EQ(driver_.GetCurrentVideoFrame(frame), LIBD_NO_FRAME);
  driver_.feed(LIBD_TIMEOUT, VIDEO_FRAME_JPEG);
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
  FedDriver::PropulateFrameInfoList(&driver_, queued, driver_.wait_key);
  TakenFrame frame;
  ASSERT_EQ(FrameTaker().take(driver_, frame), LIBD_OK);
  EXPECT_EQ(frame.bytes, "abc");
  EXPECT_EQ(frame.info.frameType, VIDEO_FRAME_H264_KEY);
  EXPECT_EQ(frame.info.seconds, 1706745599);
  EXPECT_EQ(frame.info.microseconds, 250000);
}

TEST_F(FrameQueue, AFrameForAHostWithoutASinkIsTakenAllTheSame) {
  driver_.feed(LIBD_OK, VIDEO_FRAME_JPEG);
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
    driver_.wait_key = false;
    bool failed = false;
    for (int i = 0; i < 1000 && !failed; ++i) {  // the queue fetches memory for several frames at a time
      auto frame = FedDriver::made_frame(c.type);
      const std::size_t waiting = driver_.m_FrameQueue.size();
      const AllocationFailure failure(0);
      FedDriver::ProcessCurrentFrameData(&driver_, frame, driver_.wait_key, LIBD_OK);
      failed = failure.happened();
      EXPECT_EQ(frame.data, nullptr);
      EXPECT_TRUE(!failed || driver_.m_FrameQueue.size() <= waiting);
      EXPECT_EQ(driver_.m_VideoTimedOut, failed);
    }
    EXPECT_TRUE(failed) << c.type;
    EXPECT_EQ(driver_.wait_key, c.waits_for_key) << c.type;
    driver_.state().clear_frame_queue();
  }
}

TEST_F(FrameQueue, AThrowingSinkLeavesTheFrameQueuedAndTheLockFree) {
  driver_.feed(LIBD_OK, VIDEO_FRAME_JPEG, 'j');
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
