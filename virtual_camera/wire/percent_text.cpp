#include "virtual_camera/wire/percent_text.h"

#include <fmt/format.h>

#include <cstddef>

#include "virtual_camera/values/number_text.h"

namespace vexa::camera {

std::optional<std::string> percent_decoded(std::string_view text) {
  std::string bytes;
  while (!text.empty()) {
    std::size_t length = 1;
    unsigned value = static_cast<unsigned char>(text.front());
    if (text.front() == '%') {
      length = 3;
      if (text.size() < length) return std::nullopt;
      const auto code = whole_number<unsigned>(text.substr(1, 2), 16);
      if (!code) return std::nullopt;
      value = *code;
    }
    bytes += static_cast<char>(value);
    text.remove_prefix(length);
  }
  return bytes;
}

std::string percent_encoded_for_list(std::string_view text) {
  constexpr std::string_view kMarks = "%,&";
  std::string encoded;
  for (const char c : text) {
    const auto byte = static_cast<unsigned char>(c);
    const bool plain = byte >= ' ' && byte != 0x7F && kMarks.find(c) == std::string_view::npos;
    encoded += plain ? std::string(1, c) : fmt::format("%{:02X}", byte);
  }
  return encoded;
}

}  // namespace vexa::camera
