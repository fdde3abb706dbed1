// SPDX-License-Identifier: Apache-2.0
#include "host/words/setting_words.h"

#include <fmt/format.h>

#include <algorithm>

#include "host/base/number_text.h"
#include "host/base/printable.h"

namespace vexa::host {
namespace {

bool take_number(std::string_view text, int least, int most, std::optional<int>& number) {
  number = number_text(text, least, most);
  return number.has_value();
}

template <typename Words, typename Value>
bool take_word(std::string_view text, const Words& words, std::optional<Value>& value) {
  for (const auto& entry : words) {
    if (entry.word == text) value = entry.value;
  }
  return value.has_value();
}

bool take_size(std::string_view text, std::optional<SLibDResolutionInfo>& size) {
  const std::size_t cross = std::min(text.find('x'), text.size());
  std::optional<int> width;
  std::optional<int> height;
  if (!take_number(text.substr(0, cross), 1, 9999, width)) return false;
  if (!take_number(text.substr(std::min(cross + 1, text.size())), 1, 9999, height)) return false;
  size.emplace();
  size->text = text;
  size->width = *width;
  size->height = *height;
  return true;
}

template <std::size_t kCount>
bool take_text(std::string_view text, const std::string_view (&known)[kCount], std::optional<std::string>& value) {
  if (std::find(std::begin(known), std::end(known), text) == std::end(known)) return false;
  value = text;
  return true;
}

constexpr std::string_view kExposures[] = {"Full auto", "Shutter Priority", "Iris Priority"};

struct SettingKey {
  std::string_view key;
  std::string_view takes;
  bool (*take)(std::string_view, SettingChanges&);
};

using Text = std::string_view;
using Into = SettingChanges;

constexpr SettingKey kKeys[] = {
    {"codec", "JPEG, MPEG4 or H.264", [](Text t, Into& to) { return (to.codec = codec_named(t)).has_value(); }},
    {"size", "WIDTHxHEIGHT in pixels, such as 640x480", [](Text t, Into& to) { return take_size(t, to.size); }},
    {"frame-rate", "frames per second, 1 to 60", [](Text t, Into& to) { return take_number(t, 1, 60, to.frame_rate); }},
    {"bit-rate", "kbit/s, 1 to 100000; not for JPEG",
     [](Text t, Into& to) { return take_number(t, 1, 100000, to.bit_rate); }},
    {"quality", "a level, 1 to 100; for JPEG", [](Text t, Into& to) { return take_number(t, 1, 100, to.quality); }},
    {"rotation", "degrees, 0 to 359; 180 turns the picture where the camera can, left out: 0",
     [](Text t, Into& to) { return take_number(t, 0, 359, to.rotation); }},
    {"day-night", "auto, day or night", [](Text t, Into& to) { return take_word(t, kDayNightWords, to.day_night); }},
    {"noise-reduction", "off, low, mid or high",
     [](Text t, Into& to) { return take_word(t, kNoiseWords, to.noise_reduction); }},
    {"wide-dynamic-range", "on or off", [](Text t, Into& to) { return take_word(t, kRangeWords, to.dynamic_range); }},
    {"visibility-enhancer", "off, low, mid or high",
     [](Text t, Into& to) { return take_word(t, kVisibilityWords, to.visibility); }},
    {"infrared", "off or daynight", [](Text t, Into& to) { return take_word(t, kInfraredWords, to.infrared); }},
    {"infrared-strength", "0 to 100", [](Text t, Into& to) { return take_number(t, 0, 100, to.infrared_strength); }},
    {"back-light", "on or off", [](Text t, Into& to) { return (to.back_light = switch_named(t)).has_value(); }},
    {"exposure", "\"Full auto\", \"Shutter Priority\" or \"Iris Priority\"",
     [](Text t, Into& to) { return take_text(t, kExposures, to.exposure); }}};

std::string known_keys() {
  std::string names;
  for (const SettingKey& key : kKeys) names += fmt::format("{}{}", names.empty() ? "" : ", ", key.key);
  return names;
}

const SettingKey* find_key(std::string_view name) {
  const auto found =
      std::find_if(std::begin(kKeys), std::end(kKeys), [name](const SettingKey& k) { return k.key == name; });
  return found == std::end(kKeys) ? nullptr : &*found;
}

}  // namespace

Result<SettingChanges> parse_changes(const std::vector<std::string>& texts) {
  SettingChanges changes;
  std::vector<std::string_view> seen;
  for (const std::string& text : texts) {
    const std::size_t equals = text.find('=');
    if (equals == std::string::npos) {
      return fail(
          usage(fmt::format("\"{}\" is not KEY=VALUE", printable(text)), "For instance: codec=H.264 size=1280x720."));
    }
    const SettingKey* key = find_key(std::string_view(text).substr(0, equals));
    if (key == nullptr) {
      return fail(usage(fmt::format("unknown setting \"{}\"", printable(text.substr(0, equals))),
                        fmt::format("The settings are: {}.", known_keys())));
    }
    if (std::find(seen.begin(), seen.end(), key->key) != seen.end()) {
      return fail(usage(fmt::format("{} is given twice", key->key), "Give each setting once."));
    }
    seen.push_back(key->key);
    if (!key->take(std::string_view(text).substr(equals + 1), changes)) {
      return fail(
          usage(fmt::format("the value of {} cannot be used", key->key), fmt::format("It takes {}.", key->takes)));
    }
  }
  return changes;
}

const char* switch_word(bool on) { return on ? "on" : "off"; }

std::optional<bool> switch_named(std::string_view word) {
  if (word != "on" && word != "off") return std::nullopt;
  return word == "on";
}

std::optional<ELibDDayNightType> parse_day_night(std::string_view word) {
  std::optional<ELibDDayNightType> mode;
  take_word(word, kDayNightWords, mode);
  return mode;
}

std::string known_settings() {
  std::string lines;
  for (const SettingKey& key : kKeys) lines += fmt::format("  {:<21}{}\n", key.key, key.takes);
  return lines;
}

}  // namespace vexa::host
