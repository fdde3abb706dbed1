// JSON as vexactl prints it.
#ifndef HOST_BASE_JSON_TEXT_H_
#define HOST_BASE_JSON_TEXT_H_

#include <nlohmann/json_fwd.hpp>
#include <string>

namespace vexa::host {

// A camera's texts may hold any byte: what is not UTF-8 is replaced.
[[nodiscard]] std::string to_text(const nlohmann::ordered_json& json);

// The members' names as all of vexactl's JSON has them: "day-night" becomes "dayNight", at every depth.
[[nodiscard]] nlohmann::ordered_json with_json_names(const nlohmann::ordered_json& json);

}  // namespace vexa::host

#endif  // HOST_BASE_JSON_TEXT_H_
