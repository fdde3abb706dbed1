// The wall clock of a description's range.
#include <cstddef>
#include <cstdint>
#include <cstdlib>

#include "transport/wire/rtsp_answer.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view text(reinterpret_cast<const char*>(data), size);
  const vexa::RangeClock clock = vexa::parse_range_clock(text);
  if (!clock.understood && clock.micros != 0) std::abort();
  if (clock.seconds && text.find('.') == std::string_view::npos) std::abort();
  return 0;
}
