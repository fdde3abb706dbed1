// SPDX-License-Identifier: Apache-2.0
// Alarm pins: the list of a camera's inputs, outputs and detectors, their states in the camera's answers, and when a
// tampering alarm is cleared.
#pragma once

#include <cstdint>
#include <ctime>
#include <optional>
#include <string_view>
#include <vector>

#include "device/cgi/words.h"
#include "vexa/io_info.h"

namespace vexa {

inline constexpr Word<ELibDTamperLevel> kTamperWords[] = {
    {LIBD_TAMPER_LOW, "low"}, {LIBD_TAMPER_MIDDLE, "middle"}, {LIBD_TAMPER_HIGH, "high"}};

SLibDPinInfo pin_of(std::int32_t number, ELibDPinType type, bool enabled = true);

/// Appends the inputs, then the outputs; both are counted from 1.
void append_pins(const SLibDFixedIoBoxInfo& fixed, std::vector<SLibDPinInfo>& pins);

/// The number of the first detector: the one after the inputs.
std::int32_t first_detector_number(const SLibDFixedIoBoxInfo& fixed);

/// Whether the detector of `key` ("TamperingFunc=") is switched on; also true when the answer lacks the key.
bool detector_enabled(std::string_view answer, std::string_view key);

/// The tamper level in an answer, 0 for an unknown word; nullopt when the answer lacks it.
std::optional<std::int32_t> tamper_level_of(std::string_view answer);

/// The inputs that the answer of the "sensor" inquiry names, in its order, with their states.
std::vector<SLibDPinInfo> sensor_pins(std::string_view answer);

/// A tampering pin of `state` was reported at `now`. True when it has been active for a minute and is to be cleared on
/// the camera. `since` is when it was first seen active, 0 when it is not.
bool tampering_is_due(std::int32_t state, std::time_t now, std::time_t& since);

}  // namespace vexa
