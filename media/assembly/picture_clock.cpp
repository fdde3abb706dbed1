#include "media/assembly/picture_clock.h"

namespace vexa {

PictureTime picture_time(PictureTime base, std::uint32_t elapsed, int clock_rate) {
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
