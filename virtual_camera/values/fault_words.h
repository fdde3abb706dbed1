// SPDX-License-Identifier: Apache-2.0
// Faults by the words that the command line, the control port and fleet files have for them.
#ifndef VIRTUAL_CAMERA_VALUES_FAULT_WORDS_H_
#define VIRTUAL_CAMERA_VALUES_FAULT_WORDS_H_

#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "virtual_camera/values/faults.h"

namespace vexa::camera {

// Sets one fault, such as "loss" to "0.01". False for a word that is none, or a value out of its range.
[[nodiscard]] bool set_packet_fault(PacketFaults& faults, std::string_view word, std::string_view value);

// All faults that words can set, each with its value.
[[nodiscard]] std::vector<std::pair<std::string_view, double>> packet_fault_values(const PacketFaults& faults);

// The fault of a word such as "slow-answer". It is for requests that contain `match`, or with "#N" after it for the Nth
// of them only. `value` is its time in milliseconds, its bytes, its status or its text, as the fault needs it. Nullopt
// for a word that is none, or a wrong value.
[[nodiscard]] std::optional<RequestFault> request_fault(std::string_view word, std::string_view match,
                                                        std::string_view value);

// "\r", "\n" and "\\" as one writes them in a shell.
[[nodiscard]] std::string unescaped(std::string_view text);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_VALUES_FAULT_WORDS_H_
