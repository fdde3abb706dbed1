// SPDX-License-Identifier: Apache-2.0
// Readings of image controls and steps along exposure lists: any bytes give a value of the tables or none.
#include <cstdint>
#include <cstdlib>
#include <string_view>

#include "device/cgi/image_text.h"

namespace {

void check(bool holds) {
  if (!holds) std::abort();
}

template <typename Value, std::size_t kRows>
void check_words(const vexa::Word<Value> (&table)[kRows], std::string_view word) {
  const auto value = vexa::value_of(table, word);
  check(!value || word == vexa::word_of(table, *value));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view text(reinterpret_cast<const char*>(data), size);
  check_words(vexa::kXdnrWords, text);
  check_words(vexa::kVisibilityWords, text);
  check_words(vexa::kViewDrWords, text);
  check_words(vexa::kIlluminatorWords, text);
  check_words(vexa::kDayNightRequests, text);
  check_words(vexa::kVideoOutWords, text);
  const auto mode = vexa::day_night_of(text);
  check(!mode || *mode == LIBD_DAYNIGHT_UNKNOWN || vexa::word_of(vexa::kDayNightRequests, *mode) != nullptr);
  check((vexa::exposure_control_of(text) != std::nullopt) <= (vexa::exposure_word_of(text) != nullptr));
  vexa::ExposureSteps steps;
  for (const std::uint8_t byte : text) steps.push_back({{}, byte});
  if (steps.empty()) return 0;
  const int current = steps.front().value;
  const int level = current * 40;
  const int value = vexa::exposure_value(level, steps.back().value);
  check(value >= 0 && value <= 10000);
  for (const int step : {-1, 1}) {
    const auto next = vexa::next_exposure_value(steps, current, step);
    check(!next || (*next >= 0 && *next <= 255));
  }
  return 0;
}
