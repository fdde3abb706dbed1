// The alarm and detection stream: what one text part says of the camera's inputs and detectors.
#pragma once

#include <cstdint>
#include <string_view>

namespace vexa {

/// How the camera reports motion.
struct MotionReport {
  bool one_flag;          ///< as "VMF=", else window by window
  bool motion_detection;  ///< windows are "MdWin", else "OdWin"; motion shares bit 0 with sensor 1
};

/// One bit for each input or detector: sensor 1 is bit 0, motion, tampering and audio follow the last sensor.
struct InputBits {
  std::uint32_t present = 0;  ///< the part speaks of it
  std::uint32_t state = 0;    ///< its value
};

/// Reads a part. Every key is found wherever it stands.
InputBits parse_input_part(std::string_view part, MotionReport motion);

}  // namespace vexa
