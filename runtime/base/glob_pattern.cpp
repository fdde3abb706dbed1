// SPDX-License-Identifier: Apache-2.0
#include "runtime/base/glob_pattern.h"

namespace vexa {
namespace {

constexpr std::uint16_t kQuoteBit = 0x8000;
constexpr std::uint16_t quoted(char meta) { return static_cast<std::uint16_t>(kQuoteBit | meta); }

constexpr std::uint16_t kAny = quoted('*');
constexpr std::uint16_t kOne = quoted('?');
constexpr std::uint16_t kSet = quoted('[');
constexpr std::uint16_t kNot = quoted('!');
constexpr std::uint16_t kRange = quoted('-');
constexpr std::uint16_t kEnd = quoted(']');

constexpr std::size_t kNowhere = std::string_view::npos;

std::uint16_t plain(char c) { return static_cast<unsigned char>(c); }

/// Where the set that begins at `open` lists its first character.
std::size_t set_begin(std::string_view component, std::size_t open) {
  return component.substr(open + 1, 1) == "!" ? open + 2 : open + 1;
}

}  // namespace

GlobPattern::GlobPattern(std::string_view component) {
  std::size_t last_close = component.rfind(']');
  if (last_close == kNowhere) last_close = 0;
  for (std::size_t at = 0; at < component.size();) {
    const char c = component[at];
    if (c == '*') {
      if (code_.empty() || code_.back() != kAny) code_.push_back(kAny);
      ++at;
    } else if (c == '[' && set_begin(component, at) < last_close) {
      at = add_set(component, at, component.find(']', set_begin(component, at) + 1));
    } else {
      code_.push_back(c == '?' ? kOne : plain(c));
      ++at;
    }
    has_meta_ = has_meta_ || code_.back() >= kQuoteBit;
  }
}

/// Adds the set between `open` and `close`, and returns where the component goes on.
std::size_t GlobPattern::add_set(std::string_view component, std::size_t open, std::size_t close) {
  std::size_t at = set_begin(component, open);
  code_.push_back(kSet);
  if (at == open + 2) code_.push_back(kNot);
  while (at < close) {
    code_.push_back(plain(component[at++]));
    if (component[at] != '-' || at + 1 == close) continue;
    code_.push_back(kRange);
    code_.push_back(plain(component[at + 1]));
    at += 2;
  }
  code_.push_back(kEnd);
  return close + 1;
}

// Only the last "*" that was reached can be asked to take more: what an earlier one could take, it could take too.
bool GlobPattern::matches(std::string_view name) const {
  if (name.substr(0, 1) == "." && (code_.empty() || code_.front() != plain('.'))) return false;
  std::size_t at = 0;
  std::size_t after_any = kNowhere;
  std::size_t any_end = 0;  // of what that "*" has taken
  for (std::size_t n = 0; n < name.size();) {
    if (at < code_.size() && code_[at] == kAny) {
      after_any = ++at;
      any_end = n;
      continue;
    }
    const std::size_t next = after_match(at, static_cast<unsigned char>(name[n]));
    if (next == kNowhere && after_any == kNowhere) return false;
    at = next == kNowhere ? after_any : next;
    n = next == kNowhere ? ++any_end : n + 1;
  }
  while (at < code_.size() && code_[at] == kAny) ++at;
  return at == code_.size();
}

/// Where the code goes on after the element at `at` took `c`; kNowhere when it does not take it.
std::size_t GlobPattern::after_match(std::size_t at, unsigned char c) const {
  if (at == code_.size()) return kNowhere;
  if (code_[at] == kSet) return after_set_match(at + 1, c);
  return code_[at] == kOne || code_[at] == c ? at + 1 : kNowhere;
}

std::size_t GlobPattern::after_set_match(std::size_t at, unsigned char c) const {
  const bool wanted = code_[at] != kNot;
  if (!wanted) ++at;
  bool listed = false;
  for (; code_[at] != kEnd; ++at) {
    const std::uint16_t first = code_[at];
    if (code_[at + 1] == kRange) at += 2;
    listed = listed || (first <= c && c <= code_[at]);
  }
  return listed == wanted ? at + 1 : kNowhere;
}

}  // namespace vexa
