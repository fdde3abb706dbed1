// SPDX-License-Identifier: Apache-2.0
#include "device/cgi/image_text.h"

#include <algorithm>
#include <cstdint>

#include "transport/wire/http_answer.h"

namespace vexa {
namespace {

constexpr std::int64_t kFullLevel = 10000;

constexpr Word<ELibDDayNightType> kManualWords[] = {{LIBD_DAYNIGHT_DAY, "off"}, {LIBD_DAYNIGHT_NIGHT, "on"}};

constexpr struct {
  const char* mode;
  const char* word;
} kExposureWords[] = {{kFullAuto, "full"}, {kShutterPriority, "shutter"}, {kIrisPriority, "iris"}};

/// The value after the first one that equals `current`.
template <typename Iterator>
std::optional<int> value_after(Iterator begin, Iterator end, int current) {
  const Iterator found = std::find_if(begin, end, [current](const auto& step) { return step.value == current; });
  if (found == end || std::next(found) == end) return std::nullopt;
  return std::next(found)->value;
}

}  // namespace

std::optional<ELibDDayNightType> day_night_of(std::string_view answer) {
  const auto mode = cgi_value(answer, "&DayNightMode=");
  if (!mode) return std::nullopt;
  if (*mode == "auto") return LIBD_DAYNIGHT_AUTO;
  if (*mode != "manual") return LIBD_DAYNIGHT_UNKNOWN;
  return value_of(kManualWords, cgi_value(answer, "&DayNight=").value_or("")).value_or(LIBD_DAYNIGHT_UNKNOWN);
}

const char* exposure_word_of(std::string_view mode) {
  for (const auto& row : kExposureWords) {
    if (row.mode == mode) return row.word;
  }
  return nullptr;
}

std::optional<ExposureControl> exposure_control_of(std::string_view mode) {
  if (mode == kShutterPriority) return ExposureControl::kShutter;
  if (mode == kIrisPriority) return ExposureControl::kIris;
  return std::nullopt;
}

int exposure_entry(const ExposureModes& modes, std::string_view name) {
  const auto found = std::find_if(modes.begin(), modes.end(), [name](const auto& mode) { return mode.name == name; });
  return found == modes.end() ? -1 : static_cast<int>(found - modes.begin());
}

int exposure_value(int level, int largest) {
  // Safe: counted in 64 bits, so that no list a model class fills can overflow the product.
  const std::int64_t product = std::clamp<std::int64_t>(level, 0, kFullLevel) * largest;
  const std::int64_t half_up = product / (kFullLevel / 10) % 10 >= 5 ? 1 : 0;
  return static_cast<int>(std::clamp<std::int64_t>(product / kFullLevel + half_up, 0, kFullLevel));
}

std::optional<int> next_exposure_value(const ExposureSteps& steps, int current, int step) {
  if (step > 0) return value_after(steps.begin(), steps.end(), current);
  return value_after(steps.rbegin(), steps.rend(), current);
}

}  // namespace vexa
