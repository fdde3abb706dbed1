// SPDX-License-Identifier: Apache-2.0
// Decimal numbers in texts, as the C library reads them.
#include <algorithm>
#include <cctype>
#include <cerrno>
#include <climits>
#include <cstdio>
#include <string>

#include "fuzz/check.h"
#include "runtime/base/scanned_number.h"
#include "runtime/base/text.h"

namespace {

using vexa_fuzz::check;

/// strtoll is wide enough for every int; beyond its own range it has its limits, whose sign is right.
int by_the_library(const char* text, const char** end) {
  char* after = nullptr;
  const long long value = std::strtoll(text, &after, 10);
  *end = after;
  return static_cast<int>(std::clamp<long long>(value, INT_MIN, INT_MAX));
}

void read_leading(const std::string& text) {
  const char* end = nullptr;
  check(vexa::leading_int(text) == by_the_library(text.c_str(), &end));
}

void take(const std::string& text) {
  std::string_view left = text;
  const auto taken = vexa::take_int(left);
  const char* end = nullptr;
  const int expected = by_the_library(text.c_str(), &end);
  check(taken.has_value() == (end != text.c_str()));
  if (!taken) return check(left.size() == text.size());
  check(*taken == expected && left.data() == text.data() + (end - text.c_str()));
}

void read_pair(const std::string& text) {
  const auto pair = vexa::leading_pair(text);
  const char* end = nullptr;
  const int first = by_the_library(text.c_str(), &end);
  const char* last = nullptr;
  const bool comma = end != text.c_str() && *end == ',';
  const int second = comma ? by_the_library(end + 1, &last) : 0;
  check(pair.has_value() == (comma && last != end + 1));
  if (pair) check(pair->first == first && pair->second == second);
}

void scan(const std::string& text) {
  for (const std::size_t width : {std::size_t{1}, std::size_t{2}, std::size_t{4}, std::size_t{20}}) {
    const auto scanned = vexa::scan_number(text, width);
    if (!scanned) continue;
    check(scanned->length >= 1 && scanned->length <= text.size());
    check(std::isdigit(static_cast<unsigned char>(text[scanned->length - 1])) != 0);
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  // Up to the first NUL, where the C library stops.
  const std::string text(vexa::before_nul(vexa_fuzz::text_of(data, size)));
  read_leading(text);
  take(text);
  read_pair(text);
  scan(text);
  return 0;
}
