// SPDX-License-Identifier: Apache-2.0
// Time stamps of played-back pictures: RTP timestamps on the clock of the recording.
#pragma once

#include <cstdint>

namespace vexa {

/// A moment: seconds since 1970-01-01 UTC and the fraction in microseconds.
struct PictureTime {
  std::int64_t seconds = 0;
  std::int64_t microseconds = 0;
};

/// The time of a picture `elapsed` ticks (modulo 2^32) after `base`; the zero time when the clock has no rate.
inline PictureTime picture_time(PictureTime base, std::uint32_t elapsed, int clock_rate) {
  constexpr std::int64_t kMicros = 1'000'000;
  if (clock_rate <= 0) return {};
  const auto rate = static_cast<std::uint32_t>(clock_rate);
  const std::uint64_t fraction = std::uint64_t{elapsed % rate} * kMicros / rate;
  PictureTime time{base.seconds + elapsed / rate, base.microseconds + static_cast<std::int64_t>(fraction)};
  if (time.microseconds >= kMicros) {
    time.seconds += time.microseconds / kMicros;
    time.microseconds %= kMicros;
  }
  return time;
}

}  // namespace vexa
