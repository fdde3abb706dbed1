// The camera's list of preset names.
#pragma once

#include <string_view>
#include <vector>

#include "vexa/ptz_info.h"

namespace vexa {

/// `count` presets without names, in order; none for a negative count.
std::vector<SLibDPresetInfo> unnamed_presets(int count);

/// Names presets by a list "NUMBER,NAME,NUMBER,NAME", numbers counted from 1. False when the list ends within a pair,
/// or at an empty piece or a number that no preset has; the names before it stand.
bool name_presets(std::string_view list, std::vector<SLibDPresetInfo>& presets);

}  // namespace vexa
