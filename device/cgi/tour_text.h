// SPDX-License-Identifier: Apache-2.0
// Camera tours and shadow tours as the camera writes them.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "vexa/ptz_info.h"

namespace vexa {

/// How many of `count` tours have a letter: 0 to 5.
int lettered_tours(int count);

/// The letter of tour `number`, 1 to 5.
const char* tour_letter(int number);

/// "on" or "off".
const char* switch_word(bool on);

/// True when the answer has the word "on" after the key.
bool is_switched_on(std::string_view answer, std::string_view key);

/// The number after the key; nullopt when the key or its value is missing.
std::optional<int> answered_number(std::string_view answer, std::string_view key);

/// The seconds until tours resume, by the two keys; 0 when resuming is off or the time is missing.
int resume_time_of(std::string_view answer, std::string_view switch_key, std::string_view time_key);

/// Appends the numbers of a sequence. An empty text appends none. False for a text without a comma.
bool read_tour_sequence(const std::string& text, std::vector<int>& sequence);

/// Writes a sequence, numbers cut to 7 characters; nullopt for a negative number above the preset count.
std::optional<std::string> tour_sequence_text(const std::vector<int>& sequence, int preset_count);

/// Reads the tours 1 to `tour_count`.
SLibDCameraTourInfo read_camera_tours(const std::string& answer, int tour_count);

/// The request, after its "?", that sets all tours; nullopt when the record is not for exactly `tour_count` tours, a
/// sequence is missing or more than one tour is on.
std::optional<std::string> camera_tour_request(const SLibDCameraTourInfo& info, int tour_count, int preset_count);

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
