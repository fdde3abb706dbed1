// SPDX-License-Identifier: Apache-2.0
// CRealTime::Scan and the text constructor: the input is a format, a NUL, and a text.
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>

#include "vexa/real_time.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string input(reinterpret_cast<const char*>(data), size);
  const std::string format = input.substr(0, input.find('\0'));
  const std::string text = input.substr(input.size() > format.size() ? format.size() + 1 : format.size());
  const CRealTime before(2001, 2, 3, 4, 5, 6, 7, 0, true);
  for (const bool utc : {true, false}) {
    CRealTime time = before;
    const int count = time.Scan(text.c_str(), format.c_str(), utc);
    const bool changed = time.GetUtcFileTime().dwLowDateTime != before.GetUtcFileTime().dwLowDateTime ||
                         time.GetUtcFileTime().dwHighDateTime != before.GetUtcFileTime().dwHighDateTime;
    if (count < -1 || (count <= 0 && changed)) std::abort();
    static_cast<void>(CRealTime(text.c_str(), utc).GetLocalSystemTime());
  }
  return 0;
}
