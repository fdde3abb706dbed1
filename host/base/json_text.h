// JSON as vexactl prints it.
#ifndef HOST_BASE_JSON_TEXT_H_
#define HOST_BASE_JSON_TEXT_H_

#include <nlohmann/json_fwd.hpp>
#include <string>

namespace vexa::host {

// A camera's texts may hold any byte: what is not UTF-8 is replaced.
[[nodiscard]] std::string to_text(const nlohmann::ordered_json& json);

}  // namespace vexa::host

#endif  // HOST_BASE_JSON_TEXT_H_
