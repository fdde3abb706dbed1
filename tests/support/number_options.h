// SPDX-License-Identifier: Apache-2.0
// The command line of programs whose options all take a number.
#pragma once

#include <cstdlib>
#include <initializer_list>
#include <string_view>
#include <utility>

namespace vexa_test {

/// Reads "--NAME N" pairs into what stands beside the names. False where a word is no name, or its number is missing or
/// below 1.
inline bool read_numbers(int count, char** texts, std::initializer_list<std::pair<std::string_view, long*>> options) {
  for (int i = 1; i < count; i += 2) {
    long* value = nullptr;
    for (const auto& [name, number] : options) {
      if (name == texts[i]) value = number;
    }
    if (value == nullptr || i + 1 == count) return false;
    char* end = nullptr;
    *value = std::strtol(texts[i + 1], &end, 10);
    if (*end != '\0' || *value < 1) return false;
  }
  return true;
}

}  // namespace vexa_test
