// The frames that wait for the host.
#include <utility>

#include "device/driver_state.h"
#include "media/assembly/queue_policy.h"

namespace {

/// Appends the frame; false when memory ran out, and the frame stays the caller's.
bool fits(std::deque<CVexaCommon::VideoFrameInfo>& queue, const CVexaCommon::VideoFrameInfo& frame) {
  return vexa::within_memory([&] { queue.push_back(frame); });
}

}  // namespace

void CVexaCommon::ProcessCurrentFrameData(CVexaCommon* driver, VideoFrameInfo& frame, bool& waitKey,
                                          ELibDReturnCode result) {
  driver->m_State->queue_frame(frame, waitKey, result);
}

void CVexaCommon::PropulateFrameInfoList(CVexaCommon* driver, VideoFrameInfo& frame, bool& waitKey) {
  vexa::DriverState& state = *driver->m_State;
  const vexa::Guard guard(state.driver.m_FrameQueueLock);  // the caller's already
  state.append_frame(frame, waitKey);
  state.note_video();
}

ELibDReturnCode CVexaCommon::GetCurrentVideoFrame(SLibDVideoFrameInfo& frame) {
  return m_State->take_oldest_frame(frame);
}

namespace vexa {

void DriverState::queue_frame(CVexaCommon::VideoFrameInfo& frame, bool& wait_key, ELibDReturnCode result) {
  const std::int64_t patience = whole_seconds(connection.timeout());
  const Guard guard(driver.m_FrameQueueLock);
  switch (result) {
    case LIBD_OK:
    case LIBD_FRAME_DAMAGED:
      driver.m_VideoTimedOut = false;
      append_frame(frame, wait_key);
      break;
    case LIBD_BUFFER_TOO_SMALL:
      driver.m_LargeFrameBuffers = true;
      driver.m_VideoTimedOut = false;
      break;
    case LIBD_NO_FRAME:
      driver.m_VideoTimedOut = false;
      break;
    case LIBD_FAILED:
      driver.m_VideoTimedOut = is_silent(now(), driver.m_LastFrameTime, patience);
      break;
    case LIBD_TIMEOUT:
      driver.m_VideoTimedOut = true;
      break;
    case LIBD_NOT_SUPPORTED:
    case LIBD_INVALID_ARGUMENT:
    case LIBD_INVALID_MODE:
    case LIBD_STREAM_OPEN_FAILED:
    case LIBD_UNAUTHORIZED:
      break;
  }
  free_frame(frame);  // unless it is the queue's now
  note_video();
}

void DriverState::append_frame(CVexaCommon::VideoFrameInfo& frame, bool& wait_key) {
  auto& queue = driver.m_FrameQueue;
  const QueueDecision decision = decide_queue(frame.frameType, queue.size(), wait_key);
  for (std::size_t i = 0; i < decision.oldest_to_drop; ++i) {
    free_frame(queue.front());
    queue.pop_front();
  }
  if (decision.append && fits(queue, frame)) {
    frame.data = nullptr;  // the queue's from here on
    return;
  }
  free_frame(frame);
  if (!decision.append) return;
  // Out of memory, which counts as a time-out; no picture is shown that may refer to the lost one.
  driver.m_VideoTimedOut = true;
  if (frame.frameType != VIDEO_FRAME_JPEG) wait_key = true;
}

ELibDReturnCode DriverState::take_oldest_frame(SLibDVideoFrameInfo& frame) {
  const Guard guard(driver.m_FrameQueueLock);
  if (driver.m_FrameQueue.empty()) {
    const bool timed_out = std::exchange(driver.m_VideoTimedOut, false);
    note_video();
    return timed_out ? LIBD_TIMEOUT : LIBD_NO_FRAME;
  }
  CVexaCommon::VideoFrameInfo& oldest = driver.m_FrameQueue.front();
  if (frame.sink != nullptr) frame.sink->Write(oldest.data, oldest.length);
  frame.frameType = oldest.frameType;
  frame.seconds = oldest.seconds;
  frame.microseconds = oldest.microseconds;
  free_frame(oldest);
  driver.m_FrameQueue.pop_front();
  note_video();
  return LIBD_OK;
}

void DriverState::note_video() { readiness.set_video(!driver.m_FrameQueue.empty() || driver.m_VideoTimedOut); }

void DriverState::free_frame(CVexaCommon::VideoFrameInfo& frame) {
  spare_frames.give_back(frame.data, frame.capacity);
  frame.data = nullptr;
}

void DriverState::clear_frame_queue() {
  const Guard guard(driver.m_FrameQueueLock);
  for (CVexaCommon::VideoFrameInfo& frame : driver.m_FrameQueue) free_frame(frame);
  driver.m_FrameQueue.clear();
  spare_frames.clear();
  delete[] std::exchange(driver.m_StagingBuffer, nullptr);
  driver.m_StagingBufferSize = 0;
  driver.m_VideoTimedOut = false;
  note_video();
}

}  // namespace vexa
