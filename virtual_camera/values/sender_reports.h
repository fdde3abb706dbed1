// The RTCP sender reports of a virtual camera, and what its clock does in them.
#ifndef VIRTUAL_CAMERA_VALUES_SENDER_REPORTS_H_
#define VIRTUAL_CAMERA_VALUES_SENDER_REPORTS_H_

#include <chrono>
#include <cstdint>

namespace vexa::camera {

enum class ReportedClock {
  kRunning,
  kFrozen,  // every report has the time of the first
  kZero,    // reports have NTP time 0: the camera has no clock
};

// The first report of a stream leaves before its first packet.
struct SenderReports {
  std::uint64_t every = 0;  // pictures; 0: none are sent
  ReportedClock clock = ReportedClock::kRunning;
  std::chrono::milliseconds ahead{0};  // of this machine's clock; local time sent as UTC is a multiple of 15 minutes
  double drift = 0;                    // how much faster it runs than pictures do, in parts of a million
  std::uint64_t step_at = 0;           // from this picture on the clock is `step` further; 0: never
  std::chrono::milliseconds step{0};
  bool other_ssrc = false;  // reports speak of a source that sends nothing
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_VALUES_SENDER_REPORTS_H_
