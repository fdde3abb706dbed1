#include "runtime/base/number_pair.h"

#include <string_view>

#include "runtime/base/text.h"

namespace vexa {

std::optional<NumberPair> leading_pair(const std::string& text) {
  std::string_view rest = text;
  const std::optional<int> first = take_int(rest);
  if (!first || !rest.starts_with(',')) return std::nullopt;
  rest.remove_prefix(1);
  const std::optional<int> second = take_int(rest);
  if (!second) return std::nullopt;
  return NumberPair{*first, *second};
}

}  // namespace vexa
