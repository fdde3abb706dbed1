// SPDX-License-Identifier: Apache-2.0
#include "host/base/printable.h"

#include <fmt/format.h>

#include <nlohmann/json.hpp>

namespace vexa::host {
namespace {

bool is_control(unsigned char c) { return c < 0x20 || c == 0x7f; }

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

std::string printable(std::string_view text) {
  std::string out;
  out.reserve(text.size());
  for (std::size_t i = 0; i < text.size(); ++i) {
    const auto c = static_cast<unsigned char>(text[i]);
    const auto next = static_cast<unsigned char>(i + 1 < text.size() ? text[i + 1] : '\0');
    // The C1 controls, U+0080 to U+009F, are two bytes in UTF-8 and steer some terminals too.
    const bool c1 = c == 0xc2 && next >= 0x80 && next <= 0x9f;
    if (is_control(c) || c1) {
      out += fmt::format("\\x{:02x}", c);
    } else {
      out += text[i];
    }
  }
  return out;
}

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
