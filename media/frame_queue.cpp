// CVexaCommon: the frames that wait for the host.
#include <new>
#include <utility>

#include "device/driver_state.h"
#include "media/assembly/queue_policy.h"
#include "runtime/base/sync.h"
#include "vexa/vexa_common.h"

namespace {

/// False when memory is short; the frame stays the caller's.
bool append_frame(std::deque<CVexaCommon::VideoFrameInfo>& queue, const CVexaCommon::VideoFrameInfo& frame) {
  try {
    queue.push_back(frame);
    return true;
  } catch (const std::bad_alloc&) {
    return false;
  }
}

}  // namespace

// The caller holds m_FrameQueueLock.
void CVexaCommon::FreeFrame(VideoFrameInfo& frame) {
  m_State->spare_frames.give_back(frame.data, frame.capacity);
  frame.data = nullptr;
}

void CVexaCommon::ProcessCurrentFrameData(CVexaCommon* driver, VideoFrameInfo& frame, bool& waitKey,
                                          ELibDReturnCode result) {
  const int silence = driver->ConnectionTimeout() / 1000;
  const vexa::Guard guard(driver->m_FrameQueueLock);
  switch (result) {
    case LIBD_OK:
    case LIBD_FRAME_DAMAGED:
      driver->m_VideoTimedOut = false;
      PropulateFrameInfoList(driver, frame, waitKey);
      return;
    case LIBD_BUFFER_TOO_SMALL:
      driver->m_LargeFrameBuffers = true;
      driver->m_VideoTimedOut = false;
      break;
    case LIBD_NO_FRAME:
      driver->m_VideoTimedOut = false;
      break;
    case LIBD_FAILED:
      driver->m_VideoTimedOut = driver->m_State->now() - driver->m_LastFrameTime > silence;
      break;
    case LIBD_TIMEOUT:
      driver->m_VideoTimedOut = true;
      break;
    case LIBD_NOT_SUPPORTED:
    case LIBD_INVALID_ARGUMENT:
    case LIBD_INVALID_MODE:
    case LIBD_STREAM_OPEN_FAILED:
    case LIBD_UNAUTHORIZED:
      break;
  }
  driver->FreeFrame(frame);
}

// The caller holds m_FrameQueueLock.
void CVexaCommon::PropulateFrameInfoList(CVexaCommon* driver, VideoFrameInfo& frame, bool& waitKey) {
  auto& queue = driver->m_FrameQueue;
  const vexa::QueueDecision decision = vexa::decide_queue(frame.frameType, queue.size(), waitKey);
  for (std::size_t i = 0; i < decision.oldest_to_drop; ++i) {
    driver->FreeFrame(queue.front());
    queue.pop_front();
  }
  if (decision.append && append_frame(queue, frame)) {
    frame.data = nullptr;  // the queue's from here on
    return;
  }
  driver->FreeFrame(frame);
  if (!decision.append) return;
  // Memory was short, which counts as a time-out; no picture is shown that may refer to the lost one.
  driver->m_VideoTimedOut = true;
  if (frame.frameType != VIDEO_FRAME_JPEG) waitKey = true;
}

ELibDReturnCode CVexaCommon::GetCurrentVideoFrame(SLibDVideoFrameInfo& frame) {
  const vexa::Guard guard(m_FrameQueueLock);
  if (m_FrameQueue.empty()) {
    const bool timed_out = std::exchange(m_VideoTimedOut, false);
    return timed_out ? LIBD_TIMEOUT : LIBD_NO_FRAME;
  }
  VideoFrameInfo& oldest = m_FrameQueue.front();
  if (frame.sink != nullptr) frame.sink->Write(oldest.data, oldest.length);
  frame.frameType = oldest.frameType;
  frame.seconds = oldest.seconds;
  frame.microseconds = oldest.microseconds;
  FreeFrame(oldest);
  m_FrameQueue.pop_front();
  return LIBD_OK;
}

void CVexaCommon::ClearFrameQueue() {
  const vexa::Guard guard(m_FrameQueueLock);
  for (VideoFrameInfo& frame : m_FrameQueue) FreeFrame(frame);
  m_FrameQueue.clear();
  m_State->spare_frames.clear();
  delete[] std::exchange(m_StagingBuffer, nullptr);
  m_StagingBufferSize = 0;
  m_VideoTimedOut = false;
}
