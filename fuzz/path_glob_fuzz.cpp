// SPDX-License-Identifier: Apache-2.0
// The matcher of directory search: the first line is the pattern, the rest the name. What is found is held against the
// rule, written down as plainly as it can be and bounded by a table instead of by cleverness.
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string_view>
#include <vector>

#include "runtime/base/glob_pattern.h"

namespace {

constexpr std::size_t kLongest = 300;  // the table's sides; longer inputs are only matched

struct Element {
  std::size_t length;
  bool matches;
};

/// The element that begins `pattern`, and whether it matches `c`. A star is left to the caller.
Element first_element(std::string_view pattern, unsigned char c) {
  const auto literal = static_cast<unsigned char>(pattern[0]);
  if (literal == '?') return {1, true};
  if (literal != '[') return {1, literal == c};
  const bool negated = pattern.substr(1, 1) == "!";
  const std::size_t first = negated ? 2 : 1;
  const std::size_t close = pattern.find(']', first + 1);
  if (close == std::string_view::npos) return {1, literal == c};
  bool listed = false;
  for (std::size_t at = first; at < close; ++at) {
    const auto low = static_cast<unsigned char>(pattern[at]);
    auto high = low;
    if (pattern[at + 1] == '-' && at + 2 < close) {
      at += 2;
      high = static_cast<unsigned char>(pattern[at]);
    }
    listed = listed || (low <= c && c <= high);
  }
  return {close + 1, listed != negated};
}

bool matches_by_table(std::string_view pattern, std::string_view name) {
  if (name.substr(0, 1) == "." && pattern.substr(0, 1) != ".") return false;
  // table[p][n]: whether the pattern from p on matches the name from n on
  std::vector<std::vector<bool>> table(pattern.size() + 1, std::vector<bool>(name.size() + 1, false));
  table[pattern.size()][name.size()] = true;
  for (std::size_t p = pattern.size(); p-- > 0;) {
    for (std::size_t n = name.size() + 1; n-- > 0;) {
      if (pattern[p] == '*') {
        table[p][n] = table[p + 1][n] || (n < name.size() && table[p][n + 1]);
      } else if (n < name.size()) {
        const Element element = first_element(pattern.substr(p), static_cast<unsigned char>(name[n]));
        table[p][n] = element.matches && table[p + element.length][n + 1];
      }
    }
  }
  return table[0][0];
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  std::string_view input;
  if (size > 0) input = {reinterpret_cast<const char*>(data), size};
  const std::string_view pattern = input.substr(0, input.find('\n'));
  input.remove_prefix(pattern.size());
  const std::string_view name = input.substr(input.empty() ? 0 : 1);
  const bool matches = vexa::GlobPattern(pattern).matches(name);
  if (pattern.size() > kLongest || name.size() > kLongest) return 0;
  if (matches != matches_by_table(pattern, name)) std::abort();
  return 0;
}
