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
PictureTime picture_time(PictureTime base, std::uint32_t elapsed, int clock_rate);

}  // namespace vexa
