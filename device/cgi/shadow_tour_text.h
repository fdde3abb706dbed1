// Shadow tours as the camera writes them.
#pragma once

#include <optional>
#include <string>

#include "vexa/ptz_info.h"

namespace vexa {

/// Whether `number` is one of `count` shadow tours that have a letter.
bool is_shadow_tour(int number, int count);

/// The request, after its "?", that plays one shadow tour and none of the others.
std::string shadow_tour_start(int number, int count);

/// Reads the shadow tours 1 to `count`.
SLibDShadowTourInfo read_shadow_tours(const std::string& answer, int count);

/// The request, after its "?", that sets all shadow tours; nullopt unless the record is for exactly `count` of them and
/// at most one is on.
std::optional<std::string> shadow_tour_request(const SLibDShadowTourInfo& info, int count);

}  // namespace vexa
