// SPDX-License-Identifier: Apache-2.0
// Tables of values and the camera's words for them.
#pragma once

#include <cstddef>
#include <optional>
#include <string_view>

namespace vexa {

template <typename Value>
struct Word {
  Value value;
  const char* word;
};

/// The word of a value; null for a value without one, whatever it is.
template <typename Value, std::size_t kRows>
constexpr const char* word_of(const Word<Value> (&table)[kRows], Value value) {
  for (const Word<Value>& row : table) {
    if (row.value == value) return row.word;
  }
  return nullptr;
}

/// The value of a word; nullopt for an unknown one.
template <typename Value, std::size_t kRows>
constexpr std::optional<Value> value_of(const Word<Value> (&table)[kRows], std::string_view word) {
  for (const Word<Value>& row : table) {
    if (row.word == word) return row.value;
  }
  return std::nullopt;
}

}  // namespace vexa
