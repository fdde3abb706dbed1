// SPDX-License-Identifier: Apache-2.0
#include "transport/wire/http_answer.h"

#include <locale.h>

#include <cstdio>

#include "runtime/base/text.h"

namespace vexa {
namespace {

/// While it lives, this thread reads numbers with a decimal point, whatever locale the host has chosen.
class PlainNumbers {
 public:
  PlainNumbers() : before_(uselocale(plain())) {}
  ~PlainNumbers() { uselocale(before_); }
  PlainNumbers(const PlainNumbers&) = delete;
  PlainNumbers& operator=(const PlainNumbers&) = delete;

 private:
  static locale_t plain() {
    static const locale_t locale = newlocale(LC_ALL_MASK, "C", nullptr);
    return locale;
  }

  locale_t before_;
};

}  // namespace

std::size_t header_length(std::string_view received) {
  const std::string_view text = before_nul(received);
  for (const std::string_view end : {"\r\n\r\n", "\n\n"}) {
    const std::size_t at = text.find(end);
    if (at != std::string_view::npos) return at + end.size();
  }
  return 0;
}

std::optional<StatusLine> parse_status_line(std::string_view text, std::string_view protocol) {
  if (!text.starts_with(protocol)) return std::nullopt;
  const std::string rest(before_nul(text.substr(protocol.size())));
  const PlainNumbers plain;
  long long status = 0;
  char reason[1024];
  // Kept: a "^" ends the reason phrase as a line end does; hosts compare the phrases.
  // Kept: a status without a phrase takes the next header line as its phrase; hosts show that line and know it.
  // NOLINTNEXTLINE(cert-err34-c): the count shows what is no number; a number too large becomes the largest.
  if (std::sscanf(rest.c_str(), "%*f %lld %1023[^\r^\n]", &status, reason) != 2) return std::nullopt;
  return StatusLine{clamp_to_int(status), reason};
}

std::optional<int> announced_length(std::string_view part_header) {
  auto text = text_after(part_header, "DataLen:");
  const auto length = text ? take_int(*text) : std::nullopt;
  return length >= 0 ? length : std::nullopt;
}

std::optional<std::string_view> cgi_value(std::string_view answer, std::string_view key) {
  // Kept: no word boundary. "Zoom=" is also found inside "DigitalZoom="; callers order their keys by it.
  const std::optional<std::string_view> rest = text_after(answer, key);
  if (!rest) return std::nullopt;
  return text_before(*rest, '&');
}

}  // namespace vexa
