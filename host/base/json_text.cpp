#include "host/base/json_text.h"

#include <nlohmann/json.hpp>

namespace vexa::host {

std::string to_text(const nlohmann::ordered_json& json) {
  constexpr int kIndent = 2;
  return json.dump(kIndent, ' ', false, nlohmann::ordered_json::error_handler_t::replace) + "\n";
}

}  // namespace vexa::host
