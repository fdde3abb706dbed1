// Answers to inquiries: key=value pairs joined by "&".
#pragma once

#include <optional>
#include <string_view>

namespace vexa {

/// The value of the first `key` (which carries its "="), up to the next "&" or the end; not decoded, perhaps empty.
std::optional<std::string_view> cgi_value(std::string_view answer, std::string_view key);

}  // namespace vexa
