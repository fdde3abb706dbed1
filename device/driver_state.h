// What a driver object keeps besides the fields of its class.
#pragma once

#include <ctime>
#include <memory>

#include "media/frame_store.h"
#include "media/rtp_reception.h"
#include "vexa/simple_lock.h"

namespace vexa {

/// The time of day in whole seconds; tests put their own in its place.
using SecondsClock = std::time_t (*)();

inline std::time_t system_seconds() { return std::time(nullptr); }

struct DriverState {
  CSimpleLock error_lock;   ///< guards m_LatestErrorCode and m_LatestErrorText; innermost
  CSimpleLock filter_lock;  ///< guards m_ResolutionFilter and m_FixedCameraInfo; taken before m_ConnectionLock
  SecondsClock now = system_seconds;
  std::unique_ptr<RtpReception> rtp;  ///< the streaming thread's; null while no RTP streams
  FrameStore spare_frames;            ///< guarded by m_FrameQueueLock
};

}  // namespace vexa
