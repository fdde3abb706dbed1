#include "runtime/base/number_pair.h"

#include <algorithm>
#include <cstdlib>
#include <limits>

namespace vexa {
namespace {

/// The number at `text`, which moves behind it; nothing when there is no digit.
std::optional<int> take_number(const char*& text) {
  using Limits = std::numeric_limits<int>;
  char* end = nullptr;
  const long long value = std::strtoll(text, &end, 10);
  if (end == text) return std::nullopt;
  text = end;
  return static_cast<int>(std::clamp<long long>(value, Limits::min(), Limits::max()));
}

}  // namespace

std::optional<NumberPair> leading_pair(const std::string& text) {
  const char* at = text.c_str();
  const std::optional<int> first = take_number(at);
  if (!first || *at != ',') return std::nullopt;
  ++at;
  const std::optional<int> second = take_number(at);
  if (!second) return std::nullopt;
  return NumberPair{*first, *second};
}

}  // namespace vexa
