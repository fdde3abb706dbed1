// SPDX-License-Identifier: Apache-2.0
// CRealTime::Format and CRealTimeSpan::Format: the input is eight bytes of ticks and a format.
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>

#include "runtime/real_time_format.h"
#include "vexa/real_time.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  constexpr std::size_t kLongestText = 255;
  std::int64_t ticks = 0;
  if (size < sizeof ticks) return 0;
  std::memcpy(&ticks, data, sizeof ticks);
  const std::string format(reinterpret_cast<const char*>(data) + sizeof ticks, size - sizeof ticks);
  const CRealTime time(std::time_t{0}, ticks, true);
  for (const bool utc : {true, false}) {
    if (time.Format(format.c_str(), utc).size() > kLongestText) std::abort();
  }
  if (vexa::format_span(format.c_str(), ticks).size() > kLongestText) std::abort();
  return 0;
}
