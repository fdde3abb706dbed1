// What a driver object keeps besides the fields of its class.
#pragma once

#include <atomic>
#include <ctime>
#include <memory>

#include "media/frame_store.h"
#include "media/rtp_reception.h"
#include "vexa/simple_lock.h"

namespace vexa {

/// The time of day in whole seconds; tests put their own in its place.
using SecondsClock = std::time_t (*)();

inline std::time_t system_seconds() { return std::time(nullptr); }

/// A number that no other driver object of the process has had.
inline unsigned next_driver_number() {
  static std::atomic<unsigned> latest{0};
  return ++latest;
}

struct DriverState {
  const unsigned number = next_driver_number();  ///< tells the driver from all others, also from those gone
  CSimpleLock start_stop_lock;                   ///< held by a start or stop of video from begin to end; outermost
  CSimpleLock error_lock;                        ///< guards m_LatestErrorCode and m_LatestErrorText; innermost
  CSimpleLock filter_lock;  ///< guards m_ResolutionFilter and m_FixedCameraInfo; taken before m_ConnectionLock
  CSimpleLock audio_turn;   ///< of m_AudioLock: a stop comes next, however soon a poll follows the last
  CSimpleLock io_turn;      ///< of m_IoStreamLock likewise
  CSimpleLock md_turn;      ///< of m_MdStreamLock likewise
  SecondsClock now = system_seconds;
  int teardown_timeout = 15000;       ///< milliseconds for the answer to a TEARDOWN; tests put less in its place
  std::unique_ptr<RtpReception> rtp;  ///< the streaming thread's; null while no RTP streams
  FrameStore spare_frames;            ///< guarded by m_FrameQueueLock
};

}  // namespace vexa
