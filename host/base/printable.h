// SPDX-License-Identifier: Apache-2.0
// Texts as vexactl prints them.
#ifndef HOST_BASE_PRINTABLE_H_
#define HOST_BASE_PRINTABLE_H_

#include <nlohmann/json_fwd.hpp>
#include <string>
#include <string_view>

namespace vexa::host {

// A camera's text made safe for a terminal and for one line: control characters become "\x1b" and the like, everything
// else stays as it is.
[[nodiscard]] std::string printable(std::string_view text);

// A camera's texts may hold any byte: what is not UTF-8 is replaced.
[[nodiscard]] std::string to_text(const nlohmann::ordered_json& json);

// The members' names as all of vexactl's JSON has them: "day-night" becomes "dayNight", at every depth.
[[nodiscard]] nlohmann::ordered_json with_json_names(const nlohmann::ordered_json& json);

}  // namespace vexa::host

#endif  // HOST_BASE_PRINTABLE_H_
