// SPDX-License-Identifier: Apache-2.0
// Detection settings as cameras write them: windows and object sizes, or one size and one sensitivity (LOD).
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "device/cgi/words.h"
#include "vexa/io_info.h"

namespace vexa {

/// The object sizes of LOD cameras, as the smallest object's width names them.
inline constexpr Word<int> kLodSizes[] = {{0, "small"}, {1, "middle"}, {2, "large"}};

/// Whether the setting's sensitivity, that of its first window, is 1 to 100.
bool has_sensitivity(const SLibDDetectionParam& param);

/// Whether the area of each window is two corners.
bool has_areas(const SLibDDetectionParam& param);

/// The settings in an LOD camera's answer; empty when it lacks a known size or a sensitivity.
std::vector<SLibDDetectionParam> lod_settings(std::string_view answer);

/// Whether detection follows the presets or the current view; nullopt when the answer lacks it.
std::optional<ELibDPositionMode> position_mode_of(std::string_view answer);

/// The settings that an object-detection camera's answer lists. `has_presets`: one a detection number.
std::vector<SLibDDetectionParam> object_settings(std::string_view answer, bool has_presets);

// The three requests that set a detection setting; its areas hold two corners each.
std::string object_size_request(const SLibDDetectionParam& param);
std::string first_windows_request(const SLibDDetectionParam& param);
std::string last_windows_request(const SLibDDetectionParam& param);

}  // namespace vexa
