// Two numbers with a comma between them, as cameras write sizes.
#pragma once

#include <optional>
#include <string>

namespace vexa {

struct NumberPair {
  int first;
  int second;
};

/// The two numbers that a text begins with, as scanf reads "%d,%d": blanks and a sign may come before each, the comma
/// right after the first, what follows the second is ignored. Nullopt when either is missing. Values beyond int
/// become its limits.
std::optional<NumberPair> leading_pair(const std::string& text);

}  // namespace vexa
