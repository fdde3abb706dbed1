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
  // A negative answer: the text would not even have a length.
  const bool cut = wanted < 0 || static_cast<std::size_t>(wanted) >= room;
  return {std::move(text), cut};
}

}  // namespace vexa
