#include "transport/wire/cgi_answer.h"

#include "runtime/base/text.h"

namespace vexa {

std::optional<std::string_view> cgi_value(std::string_view answer, std::string_view key) {
  // Kept: no word boundary. "Zoom=" is also found inside "DigitalZoom="; callers order their keys by it.
  const std::optional<std::string_view> rest = text_after(answer, key);
  if (!rest) return std::nullopt;
  return text_before(*rest, '&');
}

}  // namespace vexa
