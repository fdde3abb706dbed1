// SPDX-License-Identifier: Apache-2.0
// The frames that wait for the host.
#include <algorithm>
#include <utility>

#include "device/driver_state.h"
#include "media/assembly/queue_policy.h"

namespace {

/// Appends; false when memory ran out, and the queue stays as it was.
template <typename Item>
bool fits(std::deque<Item>& queue, const Item& item) {
  return vexa::within_memory([&] { queue.push_back(item); });
}

}  // namespace

void CVexaCommon::ProcessCurrentFrameData(CVexaCommon* driver, VideoFrameInfo& frame, bool& waitKey,
                                          ELibDReturnCode result) {
  driver->m_State->queue_frame(frame, waitKey, result);
}

void CVexaCommon::PropulateFrameInfoList(CVexaCommon* driver, VideoFrameInfo& frame, bool& waitKey) {
  vexa::DriverState& state = *driver->m_State;
  const vexa::Guard guard(state.driver.m_FrameQueueLock);  // the caller's already
  state.append_frame(frame, waitKey, false);
  state.note_video();
}

ELibDReturnCode CVexaCommon::GetCurrentVideoFrame(SLibDVideoFrameInfo& frame) {
  vexa::FrameFacts facts;
  return m_State->take_oldest_frame(frame, facts);
}

namespace vexa {

void DriverState::queue_frame(CVexaCommon::VideoFrameInfo& frame, bool& wait_key, ELibDReturnCode result) {
  const std::int64_t patience = whole_seconds(connection.timeout());
  const Guard guard(driver.m_FrameQueueLock);
  switch (result) {
    case LIBD_OK:
    case LIBD_FRAME_DAMAGED:
      driver.m_VideoTimedOut = false;
      append_frame(frame, wait_key, result == LIBD_FRAME_DAMAGED);
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

QueuedFacts DriverState::arrived_at_queue(const CVexaCommon::VideoFrameInfo& frame, bool is_notice) {
  QueuedFacts known;
  known.is_notice = is_notice;
  if (is_notice) {
    known.data = frame.data;
    return known;
  }
  const bool from_reader = ready_frame.data != nullptr && ready_frame.data == frame.data;
  if (from_reader) known = std::exchange(ready_frame, {});
  known.data = frame.data;
  ++(from_reader ? queue.from_reader : queue.from_elsewhere);
  known.add(std::exchange(lost_before_next, {}));
  return known;
}

bool DriverState::enqueue(const CVexaCommon::VideoFrameInfo& frame, const QueuedFacts& facts) {
  if (!fits(queued_facts, facts)) return false;
  if (fits(driver.m_FrameQueue, frame)) return true;
  queued_facts.pop_back();
  return false;
}

QueuedFacts DriverState::leave_front() {
  CVexaCommon::VideoFrameInfo& front = driver.m_FrameQueue.front();
  std::deque<QueuedFacts>& all = queued_facts;
  const auto is_front = [&front](const QueuedFacts& known) { return known.data == front.data; };
  const auto found = std::find_if(all.begin(), all.end(), is_front);
  QueuedFacts known;
  if (found != all.end()) {
    known = *found;
    all.erase(all.begin(), found + 1);
  } else {
    ++queue.from_elsewhere;  // a model class put it there itself
  }
  free_frame(front);
  driver.m_FrameQueue.pop_front();
  return known;
}

void DriverState::append_frame(CVexaCommon::VideoFrameInfo& frame, bool& wait_key, bool is_notice) {
  QueuedFacts known = arrived_at_queue(frame, is_notice);
  const QueueDecision decision = decide_queue(frame.frameType, driver.m_FrameQueue.size(), wait_key);
  LostFrames lost;
  for (std::size_t i = 0; i < decision.oldest_to_drop; ++i) {
    QueuedFacts oldest = leave_front();
    if (oldest.is_notice) continue;
    ++queue.dropped_full;
    oldest.add(std::exchange(lost, {}));
    lost = oldest.as_lost();
  }
  (queued_facts.empty() ? known : queued_facts.front()).add(lost);
  if (decision.append && enqueue(frame, known)) {
    frame.data = nullptr;  // the queue's from here on
    return;
  }
  if (!is_notice) ++(decision.append ? queue.dropped_no_memory : queue.dropped_without_key);
  lost_before_next = known.as_lost();
  free_frame(frame);
  if (!decision.append) return;
  // Out of memory, which counts as a time-out; no picture is shown that may refer to the lost one.
  driver.m_VideoTimedOut = true;
  if (frame.frameType != VIDEO_FRAME_JPEG) wait_key = true;
}

ELibDReturnCode DriverState::take_oldest_frame(SLibDVideoFrameInfo& frame, FrameFacts& facts) {
  facts = {};
  const Guard guard(driver.m_FrameQueueLock);
  if (driver.m_FrameQueue.empty()) {
    const bool timed_out = std::exchange(driver.m_VideoTimedOut, false);
    note_video();
    return timed_out ? LIBD_TIMEOUT : LIBD_NO_FRAME;
  }
  const CVexaCommon::VideoFrameInfo& oldest = driver.m_FrameQueue.front();
  if (frame.sink != nullptr) frame.sink->Write(oldest.data, oldest.length);
  frame.frameType = oldest.frameType;
  frame.seconds = oldest.seconds;
  frame.microseconds = oldest.microseconds;
  const QueuedFacts known = leave_front();
  facts = known.facts;
  if (!known.is_notice) ++queue.handed_out;
  note_video();
  return LIBD_OK;
}

void DriverState::note_video() {
  published_queue.publish(queue);
  readiness.set_video(!driver.m_FrameQueue.empty() || driver.m_VideoTimedOut);
}

void DriverState::free_frame(CVexaCommon::VideoFrameInfo& frame) {
  spare_frames.give_back(frame.data, frame.capacity, frame.length);
  frame.data = nullptr;
}

void DriverState::clear_frame_queue() {
  const Guard guard(driver.m_FrameQueueLock);
  while (!driver.m_FrameQueue.empty()) {
    if (!leave_front().is_notice) ++queue.dropped_at_stop;
  }
  queued_facts.clear();
  lost_before_next = {};
  spare_frames.clear();
  delete[] std::exchange(driver.m_StagingBuffer, nullptr);
  driver.m_StagingBufferSize = 0;
  driver.m_VideoTimedOut = false;
  note_video();
}

}  // namespace vexa
