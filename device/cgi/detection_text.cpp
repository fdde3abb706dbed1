// SPDX-License-Identifier: Apache-2.0
#include "device/cgi/detection_text.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <iterator>

#include "runtime/base/text.h"
#include "transport/wire/http_answer.h"

namespace vexa {
namespace {

constexpr std::int32_t kCurrentView = 99;
constexpr std::size_t kLodSettings = 17;
constexpr std::size_t kMostNumbers = 4;
constexpr std::size_t kSettingRequestRoom = 1024;

/// What follows the key of an item.
struct ItemValue {
  std::string_view word;
  std::array<std::int32_t, kMostNumbers> numbers{};
};

/// A kind of item: its key, how many numbers it has (none: a word), and where they go.
template <typename Target>
struct ItemForm {
  std::string_view key;
  std::size_t numbers;
  void (*store)(Target& target, const ItemValue& value);
};

using SettingForm = ItemForm<SLibDDetectionParam>;
using WindowForm = ItemForm<SLibDDetectionWindow>;

void store_nothing(SLibDDetectionParam&, const ItemValue&) {}

void store_sensitivity(SLibDDetectionParam& param, const ItemValue& value) {
  for (SLibDDetectionWindow& window : param.windows) window.sensitivity = value.numbers[0];
}

void store_smallest(SLibDDetectionParam& param, const ItemValue& value) {
  for (SLibDDetectionWindow& window : param.windows) {
    window.minObjectWidth = value.numbers[0];
    window.minObjectHeight = value.numbers[1];
  }
}

void store_largest(SLibDDetectionParam& param, const ItemValue& value) {
  for (SLibDDetectionWindow& window : param.windows) {
    window.maxObjectWidth = value.numbers[0];
    window.maxObjectHeight = value.numbers[1];
  }
}

void store_enabled(SLibDDetectionWindow& window, const ItemValue& value) {
  window.enabled = value.word == "on" ? 1 : 0;
}

void store_area(SLibDDetectionWindow& window, const ItemValue& value) {
  window.area.clear();
  window.area.push_back({value.numbers[0], value.numbers[1]});
  window.area.push_back({value.numbers[2], value.numbers[3]});
}

void store_mode(SLibDDetectionWindow& window, const ItemValue& value) { window.mode = value.word == "det" ? 0 : 1; }

constexpr SettingForm kSettingForms[] = {{"Mode=", 0, store_nothing},           {"ThresholdR=", 1, store_sensitivity},
                                         {"ThresholdG=", 1, store_sensitivity}, {"ThresholdB=", 1, store_sensitivity},
                                         {"MinObjectSize=", 2, store_smallest}, {"MaxObjectSize=", 2, store_largest},
                                         {"CandidateFrame=", 1, store_nothing}};

/// After "Win1" to "Win4".
constexpr WindowForm kWindowForms[] = {{"=", 0, store_enabled}, {"Area=", 4, store_area}, {"Mode=", 0, store_mode}};

/// The word that `text` begins with after blanks, as scanf's "%s" takes it.
std::optional<ItemValue> read_word_value(std::string_view text) {
  constexpr char kBlanks[] = " \t\n\v\f\r";
  const std::size_t begin = text.find_first_not_of(kBlanks);
  if (begin == std::string_view::npos) return std::nullopt;
  text.remove_prefix(begin);
  return ItemValue{text.substr(0, text.find_first_of(kBlanks)), {}};
}

std::optional<ItemValue> read_numbers(std::string_view text, std::size_t count) {
  ItemValue value;
  for (std::size_t i = 0; i < count; ++i) {
    if (i > 0 && !text.starts_with(',')) return std::nullopt;
    text.remove_prefix(i > 0 ? 1 : 0);
    const auto number = take_int(text);
    if (!number) return std::nullopt;
    value.numbers[i] = *number;
  }
  return value;
}

template <typename Target>
std::optional<ItemValue> read_form(const ItemForm<Target>& form, std::string_view text) {
  if (!text.starts_with(form.key)) return std::nullopt;
  text.remove_prefix(form.key.size());
  return form.numbers == 0 ? read_word_value(text) : read_numbers(text, form.numbers);
}

/// One "Od" item, whole: what it sets, of which setting.
struct DetectionItem {
  std::int32_t number = 0;
  ItemValue value;
  const SettingForm* setting = nullptr;
  const WindowForm* window = nullptr;
  std::size_t window_index = 0;

  void store(SLibDDetectionParam& param) const {
    param.number = number;
    if (setting != nullptr) setting->store(param, value);
    if (window != nullptr) window->store(param.windows[window_index], value);
  }
};

bool read_setting_item(std::string_view text, DetectionItem& item) {
  for (const SettingForm& form : kSettingForms) {
    const auto value = read_form(form, text);
    if (!value) continue;
    item.setting = &form;
    item.value = *value;
    return true;
  }
  return false;
}

bool read_window_item(std::string_view text, DetectionItem& item) {
  constexpr std::string_view kWindow = "Win";
  if (!text.starts_with(kWindow) || text.size() == kWindow.size()) return false;
  const char index = text[kWindow.size()];
  if (index < '1' || index > '4') return false;
  text.remove_prefix(kWindow.size() + 1);
  for (const WindowForm& form : kWindowForms) {
    const auto value = read_form(form, text);
    if (!value) continue;
    item.window = &form;
    item.window_index = static_cast<std::size_t>(index - '1');
    item.value = *value;
    return true;
  }
  return false;
}

std::optional<DetectionItem> read_item(std::string_view text) {
  constexpr std::string_view kPrefix = "Od";
  if (!text.starts_with(kPrefix)) return std::nullopt;
  text.remove_prefix(kPrefix.size());
  const auto number = take_int(text);
  if (!number) return std::nullopt;
  DetectionItem item;
  item.number = *number;
  if (!read_setting_item(text, item) && !read_window_item(text, item)) return std::nullopt;
  return item;
}

const char* switch_of(const SLibDDetectionWindow& window) { return window.enabled == 1 ? "on" : "off"; }

const char* mode_of(const SLibDDetectionWindow& window) { return window.mode != 0 ? "mask" : "det"; }

}  // namespace

bool has_sensitivity(const SLibDDetectionParam& param) {
  return param.windows[0].sensitivity >= 1 && param.windows[0].sensitivity <= 100;
}

bool has_areas(const SLibDDetectionParam& param) {
  return std::all_of(std::begin(param.windows), std::end(param.windows),
                     [](const SLibDDetectionWindow& window) { return window.area.size() == 2; });
}

std::vector<SLibDDetectionParam> lod_settings(std::string_view answer) {
  const auto word = cgi_value(answer, "LODMinObjectSize=");
  const auto size = word ? value_of(kLodSizes, *word) : std::nullopt;
  auto text = text_after(answer, "LODSensitivity=");
  const auto sensitivity = size && text ? take_int(*text) : std::nullopt;
  if (!sensitivity) return {};
  SLibDDetectionParam param;
  param.windows[0].minObjectWidth = *size;
  param.windows[0].sensitivity = *sensitivity;
  // Kept: as many settings as a camera with 16 presets and the current view has; hosts look up by place.
  return std::vector<SLibDDetectionParam>(kLodSettings, param);
}

std::optional<ELibDPositionMode> position_mode_of(std::string_view answer) {
  const auto word = cgi_value(answer, "PositionMode=");
  if (!word) return std::nullopt;
  return *word == "current" ? LIBD_POSITION_CURRENT : LIBD_POSITION_PRESET;
}

std::vector<SLibDDetectionParam> object_settings(std::string_view answer, bool has_presets) {
  std::vector<SLibDDetectionParam> settings;
  const std::size_t begin = answer.rfind("ODPreDef");
  if (begin == std::string_view::npos) return settings;
  SLibDDetectionParam working;
  // Kept: what an item did not set comes from the setting before; one number's values go on into the next.
  for (auto rest = text_after(answer.substr(begin), "&"); rest; rest = text_after(*rest, "&")) {
    const auto item = read_item(text_before(*rest, '&'));
    if (!item) continue;
    if (has_presets && working.number != -1 && working.number != item->number) settings.push_back(working);
    item->store(working);
  }
  // Kept: the setting that the answer ends with is listed only when it is the current view's.
  if (working.number == kCurrentView) settings.push_back(working);
  return settings;
}

std::string object_size_request(const SLibDDetectionParam& param) {
  const int n = param.number;
  const SLibDDetectionWindow& w = param.windows[0];
  return format_within(kSettingRequestRoom,
                       "/command/objectdetection.cgi?Od%02dThresholdR=%d&Od%02dThresholdG=%d&Od%02dThresholdB=%d"
                       "&Od%02dMinObjectSize=%d,%d&Od%02dMaxObjectSize=%d,%d",
                       n, w.sensitivity, n, w.sensitivity, n, w.sensitivity, n, w.minObjectWidth, w.minObjectHeight, n,
                       w.maxObjectWidth, w.maxObjectHeight)
      .text;
}

std::string first_windows_request(const SLibDDetectionParam& param) {
  const int n = param.number;
  const SLibDDetectionWindow& a = param.windows[0];
  const SLibDDetectionWindow& b = param.windows[1];
  return format_within(kSettingRequestRoom,
                       "/command/objectdetection.cgi?Od%02dWin1=%s&Od%02dWin1Area=%d,%d,%d,%d&Od%02dWin1Mode=%s"
                       "&Od%02dWin2=%s&Od%02dWin2Area=%d,%d,%d,%d&Od%02dWin2Mode=%s",
                       n, switch_of(a), n, a.area[0].x, a.area[0].y, a.area[1].x, a.area[1].y, n, mode_of(a),  //
                       n, switch_of(b), n, b.area[0].x, b.area[0].y, b.area[1].x, b.area[1].y, n, mode_of(b))
      .text;
}

std::string last_windows_request(const SLibDDetectionParam& param) {
  const int n = param.number;
  const SLibDDetectionWindow& a = param.windows[2];
  const SLibDDetectionWindow& b = param.windows[3];
  return format_within(kSettingRequestRoom,
                       "/command/objectdetection.cgi?Od%02dWin3=%s&Od%02dWin3Area=%d,%d,%d,%d&Od%02dWin3Mode=%s"
                       "&Od%02dWin4=%s&Od%02dWin4Area=%d,%d,%d,%d&Od%02dWin4Mode=%s",
                       n, switch_of(a), n, a.area[0].x, a.area[0].y, a.area[1].x, a.area[1].y, n, mode_of(a),  //
                       n, switch_of(b), n, b.area[0].x, b.area[0].y, b.area[1].x, b.area[1].y, n, mode_of(b))
      .text;
}

}  // namespace vexa
