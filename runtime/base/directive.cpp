// SPDX-License-Identifier: Apache-2.0
#include "runtime/base/directive.h"

#include <algorithm>
#include <climits>

namespace vexa {
namespace {

constexpr std::string_view kFlagCharacters = "#-.0123456789";
constexpr std::string_view kDigits = "0123456789";

/// Takes the characters out of `set` from the front of `text`.
std::string_view take_while(std::string_view& text, std::string_view set) {
  const std::string_view taken = text.substr(0, text.find_first_not_of(set));
  text.remove_prefix(taken.size());
  return taken;
}

std::size_t bounded_number(std::string_view digits) {
  std::uint64_t number = 0;
  for (const char digit : digits) {
    number = std::min<std::uint64_t>(number * 10 + static_cast<std::uint64_t>(digit - '0'), INT_MAX);
  }
  return static_cast<std::size_t>(number);
}

/// As many of `count` characters as the longest text holds.
std::string run_of(std::size_t count, char character) {
  return std::string(std::min(count, kDirectiveTextLimit), character);
}

// Kept: a field wider than the longest text keeps its front, which may be padding alone, as printf fills a full buffer.
std::string padded(const std::string& before, std::size_t zeros, const std::string& digits, const FieldFlags& flags) {
  const std::size_t length = before.size() + zeros + digits.size();
  const std::string blanks = run_of(flags.width > length ? flags.width - length : 0, ' ');
  const std::string text = before + run_of(zeros, '0') + digits;
  return (flags.left ? text + blanks : blanks + text).substr(0, kDirectiveTextLimit);
}

/// Takes one directive, whose "%" is gone already, from the front of `rest`.
std::string take_directive(std::string_view& rest, const DirectiveWriter& writer) {
  const std::string_view whole = rest;
  const std::string_view flag_text = take_while(rest, kFlagCharacters);
  if (!rest.empty()) {
    const char letter = rest.front();
    rest.remove_prefix(1);
    if (letter == '%') return "%";
    const auto flags = parse_field_flags(flag_text);
    const auto written = flags ? writer(letter, *flags) : std::nullopt;
    if (written) return *written;
  }
  return std::string("%").append(whole.substr(0, std::min(whole.size() - rest.size(), kDirectiveTextLimit)));
}

}  // namespace

std::optional<FieldFlags> parse_field_flags(std::string_view text) {
  FieldFlags flags;
  const std::string_view marks = take_while(text, "#-0");
  flags.left = marks.find('-') != std::string_view::npos;
  flags.zeros = marks.find('0') != std::string_view::npos;
  flags.width = bounded_number(take_while(text, kDigits));
  if (!text.empty() && text.front() == '.') {
    text.remove_prefix(1);
    flags.precision = bounded_number(take_while(text, kDigits));
  }
  if (!text.empty()) return std::nullopt;
  return flags;
}

std::string number_field(std::int64_t value, const FieldFlags& flags) {
  const std::string sign = value < 0 ? "-" : "";
  std::string digits = std::to_string(value).substr(sign.size());
  if (flags.precision == std::size_t{0} && value == 0) digits.clear();
  std::size_t least = flags.precision.value_or(0);
  if (flags.zeros && !flags.left && !flags.precision && flags.width > sign.size()) least = flags.width - sign.size();
  return padded(sign, least > digits.size() ? least - digits.size() : 0, digits, flags);
}

std::string text_field(std::string_view text, const FieldFlags& flags) {
  return padded("", 0, std::string(text.substr(0, flags.precision.value_or(text.size()))), flags);
}

std::string two_digits(std::int64_t value) { return number_field(value, {.zeros = true, .width = 2, .precision = {}}); }

std::string four_digits(std::int64_t value) {
  return number_field(value, {.zeros = true, .width = 4, .precision = {}});
}

std::string expand_directives(const char* format, const DirectiveWriter& writer) {
  std::string text;
  std::string_view rest = format == nullptr ? "" : format;
  // Kept: the last 14 characters are for what one directive writes; plain characters stop before them.
  while (!rest.empty() && text.size() < kDirectiveTextFull) {
    const char next = rest.front();
    rest.remove_prefix(1);
    const std::string piece = next == '%' ? take_directive(rest, writer) : std::string(1, next);
    // Safe: names, wide fields and long runs of flags are cut where the text ends.
    text.append(piece, 0, kDirectiveTextLimit - text.size());
  }
  return text;
}

}  // namespace vexa
