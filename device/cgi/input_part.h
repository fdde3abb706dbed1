// SPDX-License-Identifier: Apache-2.0
// The alarm and detection stream: what one text part reports of the camera's inputs and detectors, and the pins that
// hosts get for it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>
#include <vector>

#include "vexa/io_info.h"

namespace vexa {

/// How the camera reports motion.
struct MotionReport {
  bool one_flag;          ///< as "VMF=", else window by window
  bool motion_detection;  ///< windows are "MdWin", else "OdWin"; motion shares bit 0 with sensor 1
};

/// One bit for each input or detector: sensor 1 is bit 0, the detectors follow the last sensor in kDetectorOrder.
struct PinMasks {
  std::uint32_t present = 0;  ///< the camera reported the pin
  std::uint32_t state = 0;    ///< its value
};

/// The detectors in the order in which their bits, and so their pins, follow the inputs.
inline constexpr ELibDPinType kDetectorOrder[] = {PIN_TYPE_DETECTION, PIN_TYPE_TAMPERING, PIN_TYPE_AUDIO_DETECTION};

/// Reads a part. Every key is found wherever it stands.
PinMasks parse_input_part(std::string_view part, MotionReport motion);

inline constexpr std::size_t kMostStatusPins = 32;

/// Replaces `pins` by those that the camera reported, in order. After the inputs come the detectors that the camera
/// has, in kDetectorOrder. Allocates nothing when there is room for kMostStatusPins.
void take_status_pins(PinMasks masks, const SLibDFixedIoBoxInfo& fixed, std::vector<SLibDPinInfo>& pins);

/// Takes the values of a part's body. A value that it does not have stays as it is.
void take_metadata(std::string_view body, SLibDRawMDFrameInfo& frame);

}  // namespace vexa
