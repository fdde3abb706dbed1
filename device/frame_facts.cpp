// Frames with what is known of them.
#include "vexa/frame_facts.h"

#include <algorithm>
#include <cstddef>
#include <cstring>

#include "device/driver_state.h"

namespace vexa {

ELibDReturnCode GetCurrentVideoFrame(CVexaCommon& driver, SLibDVideoFrameInfo& frame, FrameFacts& facts) {
  FrameFacts known;
  const ELibDReturnCode result = DriverState::of(driver).take_oldest_frame(frame, known);
  known.size = static_cast<std::uint32_t>(std::min<std::size_t>(facts.size, sizeof known));
  std::memcpy(static_cast<void*>(&facts), &known, known.size);
  return result;
}

}  // namespace vexa
