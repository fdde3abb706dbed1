// SPDX-License-Identifier: Apache-2.0
// Small functions on text: what follows a key, what comes before a mark, decimal numbers, hidden secrets, bounded
// formatting.
#pragma once

#include <cstdarg>
#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

namespace vexa {

/// What follows the first occurrence of `key`, to the end; nullopt when there is none.
std::optional<std::string_view> text_after(std::string_view text, std::string_view key);

/// What comes before the first `mark`; the whole text when there is none.
std::string_view text_before(std::string_view text, char mark);

/// What comes before the first NUL: the text as a C function reads it.
inline std::string_view before_nul(std::string_view text) { return text_before(text, '\0'); }

/// The value, limited to the range of an int.
int clamp_to_int(long long value);

/// The number that a text begins with, as strtol reads it in base 10: blanks and a sign may come first, what
/// follows is ignored, no digit is 0. Values beyond int become its limits.
int leading_int(const std::string& text);

/// The number that `text` begins with after blanks, as scanf's "%d" takes it: `text` begins after it from then on.
/// Nullopt, and `text` stays, when there is no digit. Values beyond int become its limits.
std::optional<int> take_int(std::string_view& text);

/// ASCII letters and digits, whatever the host's locale.
bool is_ascii_alphanumeric(char c);

/// The text with "***" in the place of each `secret`; unchanged when that is empty.
std::string masked(std::string text, std::string_view secret);

/// A text made as snprintf makes it.
struct Formatted {
  std::string text;
  bool cut;  ///< more was wanted than there was room for
};

/// Formats into `room` bytes, the terminator among them; `room` is at least 1.
Formatted format_within(std::size_t room, const char* format, ...) __attribute__((format(printf, 2, 3)));
Formatted vformat_within(std::size_t room, const char* format, va_list arguments) __attribute__((format(printf, 2, 0)));

}  // namespace vexa
