// SPDX-License-Identifier: Apache-2.0
// What camera tours and shadow tours have in common, in the words of the command line.
#ifndef HOST_WORDS_TOUR_WORDS_H_
#define HOST_WORDS_TOUR_WORDS_H_

#include <fmt/format.h>

#include <string>

namespace vexa::host {

// Longest wait before a tour goes on, as vexactl takes it, in seconds.
inline constexpr int kLongestResume = 9999;

// Of the seconds after a move by hand; 0: it does not go on.
[[nodiscard]] inline std::string resume_text(int seconds) {
  return seconds > 0 ? fmt::format("resumed after {} s", seconds) : "not resumed after a move by hand";
}

}  // namespace vexa::host

#endif  // HOST_WORDS_TOUR_WORDS_H_
