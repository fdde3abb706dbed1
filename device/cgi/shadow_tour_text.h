// Shadow tours as the camera writes them.
#pragma once

#include <optional>
#include <string>

#include "vexa/ptz_info.h"

namespace vexa {

/// Whether `number` is one of `count` shadow tours that have a letter.
bool is_shadow_tour(int number, int count);

/// What plays one shadow tour and none of the others, after the "?".
std::string shadow_tour_start(int number, int count);

/// Reads the shadow tours 1 to `count`.
SLibDShadowTourInfo read_shadow_tours(const std::string& answer, int count);

/// What sets all shadow tours, after the "?"; nothing when the record is not for exactly `count` of them or more than
/// one is on.
std::optional<std::string> shadow_tour_request(const SLibDShadowTourInfo& info, int count);

}  // namespace vexa
