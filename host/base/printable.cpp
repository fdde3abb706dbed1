// SPDX-License-Identifier: Apache-2.0
#include "host/base/printable.h"

#include <fmt/format.h>

#include <nlohmann/json.hpp>

namespace vexa::host {
namespace {

bool is_control(unsigned char c) { return c < 0x20 || c == 0x7f; }

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

}  // namespace vexa::host
