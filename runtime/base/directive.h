// SPDX-License-Identifier: Apache-2.0
// Formats made of directives: "%", printf's flags and a letter. Fields are padded in this file, so that no text from
// outside is ever used as a format of printf.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <string_view>

namespace vexa {

/// The longest text a format can grow into.
constexpr std::size_t kDirectiveTextLimit = 255;
/// Copying stops once so many characters are written.
constexpr std::size_t kDirectiveTextFull = 241;

/// The flags between "%" and the letter.
struct FieldFlags {
  bool left = false;      ///< "-": pad on the right
  bool zeros = false;     ///< "0": pad a number with zeros
  std::size_t width = 0;  ///< at least so many characters
  /// At least so many digits of a number; at most so many characters of a text.
  std::optional<std::size_t> precision;
};

/// Reads the characters "#-.0123456789" as printf does; nullopt when printf has no meaning for them. Numbers
/// above INT_MAX count as INT_MAX.
std::optional<FieldFlags> parse_field_flags(std::string_view text);

/// The number as printf writes it with these flags and "d", its first kDirectiveTextLimit characters.
std::string number_field(std::int64_t value, const FieldFlags& flags);
/// The text as printf writes it with these flags and "s", its first kDirectiveTextLimit characters.
std::string text_field(std::string_view text, const FieldFlags& flags);

/// At least two or four digits, zeros in front.
std::string two_digits(std::int64_t value);
std::string four_digits(std::int64_t value);

/// Returns the text for a letter with these flags; nullopt for an unknown letter.
using DirectiveWriter = std::function<std::optional<std::string>(char letter, const FieldFlags& flags)>;

/// Copies `format`, null being empty, with `writer`'s text for each directive. "%%" is "%"; a directive that the writer
/// does not know or whose flags have no meaning is copied as it stands.
std::string expand_directives(const char* format, const DirectiveWriter& writer);

}  // namespace vexa
