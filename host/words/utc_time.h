// SPDX-License-Identifier: Apache-2.0
// Moments as "2024-01-31T23:59:59Z".
#ifndef HOST_WORDS_UTC_TIME_H_
#define HOST_WORDS_UTC_TIME_H_

#include <chrono>
#include <optional>
#include <string>

namespace vexa::host {

[[nodiscard]] std::string utc_text(std::chrono::seconds since_1970);
// To the millisecond: "2026-01-31T12:00:00.250Z".
[[nodiscard]] std::string utc_text(std::chrono::system_clock::time_point moment);

// The first of these texts as seconds since 1970, also without its "Z"; nullopt for any other text and for days that do
// not exist.
[[nodiscard]] std::optional<std::chrono::seconds> utc_moment(const std::string& text);

}  // namespace vexa::host

#endif  // HOST_WORDS_UTC_TIME_H_
