#include "host/base/json_text.h"

#include <nlohmann/json.hpp>

namespace vexa::host {
namespace {

std::string json_name(const std::string& words) {
  std::string name;
  bool begins_word = false;
  for (const char letter : words) {
    const bool joins = letter == '-';
    if (!joins) name += begins_word && letter >= 'a' && letter <= 'z' ? static_cast<char>(letter - 'a' + 'A') : letter;
    begins_word = joins;
  }
  return name;
}

}  // namespace

std::string to_text(const nlohmann::ordered_json& json) {
  constexpr int kIndent = 2;
  return json.dump(kIndent, ' ', false, nlohmann::ordered_json::error_handler_t::replace) + "\n";
}

nlohmann::ordered_json with_json_names(const nlohmann::ordered_json& json) {
  if (!json.is_structured()) return json;
  nlohmann::ordered_json named = json.is_array() ? nlohmann::ordered_json::array() : nlohmann::ordered_json::object();
  for (const auto& [key, value] : json.items()) {
    if (json.is_array()) {
      named.push_back(with_json_names(value));
    } else {
      named[json_name(key)] = with_json_names(value);
    }
  }
  return named;
}

}  // namespace vexa::host
