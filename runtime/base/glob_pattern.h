// SPDX-License-Identifier: Apache-2.0
// Matching of one name against one component of a search pattern.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>
#include <vector>

namespace vexa {

/// A compiled component: "*" stands for any characters, "?" for one, "[...]" for one that is listed or lies in a listed
/// range, "[!...]" for one that does not. A "]" right after "[" or "[!" is listed; a "-" before the closing "]" is.
/// A "[" without its "]" and every other character, "\" too, is itself. Bytes are compared, not characters.
class GlobPattern {
 public:
  explicit GlobPattern(std::string_view component);

  /// Whether it holds a character with a special meaning.
  bool has_meta() const { return has_meta_; }

  /// A dot that begins a name is matched by a dot alone. Takes at most pattern length x name length steps.
  bool matches(std::string_view name) const;

 private:
  std::size_t add_set(std::string_view component, std::size_t open, std::size_t close);
  std::size_t after_match(std::size_t at, unsigned char c) const;
  std::size_t after_set_match(std::size_t at, unsigned char c) const;

  // Characters; those with the quote bit are meta characters.
  std::vector<std::uint16_t> code_;
  bool has_meta_ = false;
};

}  // namespace vexa
