// SPDX-License-Identifier: Apache-2.0
#include "runtime/base/text.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <limits>

namespace vexa {

std::optional<std::string_view> text_after(std::string_view text, std::string_view key) {
  const std::size_t at = text.find(key);
  if (at == std::string_view::npos) return std::nullopt;
  return text.substr(at + key.size());
}

std::string_view text_before(std::string_view text, char mark) { return text.substr(0, text.find(mark)); }

int clamp_to_int(long long value) {
  using Limits = std::numeric_limits<int>;
  return static_cast<int>(std::clamp<long long>(value, Limits::min(), Limits::max()));
}

int leading_int(const std::string& text) { return clamp_to_int(std::strtoll(text.c_str(), nullptr, 10)); }

std::optional<int> take_int(std::string_view& text) {
  const std::size_t begin = std::min(text.find_first_not_of(" \t\n\v\f\r"), text.size());
  const std::size_t sign = text.substr(begin).starts_with('-') || text.substr(begin).starts_with('+') ? 1 : 0;
  const std::string_view digits = text.substr(begin + sign);
  const std::size_t count = std::min(digits.find_first_not_of("0123456789"), digits.size());
  if (count == 0) return std::nullopt;
  const std::string number(text.substr(begin, sign + count));
  text.remove_prefix(begin + number.size());
  return leading_int(number);
}

bool is_ascii_alphanumeric(char c) {
  return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9');
}

std::string masked(std::string text, std::string_view secret) {
  constexpr std::string_view kMask = "***";
  if (secret.empty()) return text;
  for (std::size_t at = text.find(secret); at != std::string::npos; at = text.find(secret, at + kMask.size())) {
    text.replace(at, secret.size(), kMask);
  }
  return text;
}

Formatted format_within(std::size_t room, const char* format, ...) {
  va_list arguments;
  va_start(arguments, format);
  Formatted formatted = vformat_within(room, format, arguments);
  va_end(arguments);
  return formatted;
}

Formatted vformat_within(std::size_t room, const char* format, va_list arguments) {
  std::string text(room, '\0');
  // NOLINTNEXTLINE(clang-analyzer-valist.Uninitialized): the caller has begun the list.
  const int wanted = std::vsnprintf(text.data(), room, format, arguments);
  text.resize(before_nul(text).size());
  // A negative result: the text would be too long for a length.
  const bool cut = wanted < 0 || static_cast<std::size_t>(wanted) >= room;
  return {std::move(text), cut};
}

}  // namespace vexa
