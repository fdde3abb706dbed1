// SPDX-License-Identifier: Apache-2.0
// Settings in the words of the command line: "codec=H.264", "day-night=auto".
#ifndef HOST_WORDS_SETTING_WORDS_H_
#define HOST_WORDS_SETTING_WORDS_H_

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "host/base/codec.h"
#include "host/base/problem.h"
#include "vexa/common_types.h"
#include "vexa/image_info.h"
#include "vexa/video_info.h"

namespace vexa::host {

template <typename Value>
struct SettingWord {
  std::string_view word;
  Value value;
};

inline constexpr std::array<SettingWord<ELibDDayNightType>, 3> kDayNightWords{
    {{"auto", LIBD_DAYNIGHT_AUTO}, {"day", LIBD_DAYNIGHT_DAY}, {"night", LIBD_DAYNIGHT_NIGHT}}};
inline constexpr std::array<SettingWord<ELibDXdnrType>, 4> kNoiseWords{
    {{"off", LIBD_XDNR_OFF}, {"low", LIBD_XDNR_LOW}, {"mid", LIBD_XDNR_MIDDLE}, {"high", LIBD_XDNR_HIGH}}};
inline constexpr std::array<SettingWord<ELibDVisibilityEnhancerType>, 4> kVisibilityWords{
    {{"off", LIBD_VISIBILITY_OFF},
     {"low", LIBD_VISIBILITY_LOW},
     {"mid", LIBD_VISIBILITY_MIDDLE},
     {"high", LIBD_VISIBILITY_HIGH}}};
inline constexpr std::array<SettingWord<ELibDViewDRMode>, 2> kRangeWords{
    {{"off", LIBD_VIEWDR_OFF}, {"on", LIBD_VIEWDR_ON}}};
inline constexpr std::array<SettingWord<ELibIRIlluminatorMode>, 2> kInfraredWords{
    {{"off", LIB_IR_OFF}, {"daynight", LIB_IR_DAYNIGHT}}};
inline constexpr std::array<SettingWord<ELibVideoOutMode>, 3> kOutputWords{
    {{"ip", LIB_VIDEO_OUT_IP}, {"pal", LIB_VIDEO_OUT_PAL}, {"ntsc", LIB_VIDEO_OUT_NTSC}}};

template <typename Words, typename Value>
[[nodiscard]] std::optional<std::string> word_for(const Words& words, Value value) {
  for (const auto& entry : words) {
    if (entry.value == value) return std::string(entry.word);
  }
  return std::nullopt;
}

// The changes that `vexactl set` is to make.
struct SettingChanges {
  std::optional<Codec> codec = {};
  std::optional<SLibDResolutionInfo> size = {};
  std::optional<int> frame_rate = {};
  std::optional<int> bit_rate = {};
  std::optional<int> quality = {};
  std::optional<int> rotation = {};
  std::optional<ELibDDayNightType> day_night = {};
  std::optional<ELibDXdnrType> noise_reduction = {};
  std::optional<ELibDVisibilityEnhancerType> visibility = {};
  std::optional<ELibDViewDRMode> dynamic_range = {};
  std::optional<ELibIRIlluminatorMode> infrared = {};
  std::optional<int> infrared_strength = {};
  std::optional<bool> back_light = {};
  std::optional<std::string> exposure = {};

  [[nodiscard]] bool of_stream() const { return codec || size || frame_rate || bit_rate || quality || rotation; }
};

// Reads "KEY=VALUE" texts, each key once; a refusal names the values that the key takes.
[[nodiscard]] Result<SettingChanges> parse_changes(const std::vector<std::string>& texts);

// "on" or "off".
[[nodiscard]] const char* switch_word(bool on);
[[nodiscard]] std::optional<bool> switch_named(std::string_view word);

// "auto", "day" or "night".
[[nodiscard]] std::optional<ELibDDayNightType> parse_day_night(std::string_view word);

// A line for each key that can be set, with what it takes.
[[nodiscard]] std::string known_settings();

}  // namespace vexa::host

#endif  // HOST_WORDS_SETTING_WORDS_H_
