// SPDX-License-Identifier: Apache-2.0
// Motion metadata of any bytes: a window without a number of its own keeps its value, and reading again changes
// nothing.
#include <cstdint>
#include <cstdlib>
#include <string_view>

#include "device/cgi/input_part.h"

namespace {

constexpr std::int32_t kUntouched = -12345;

void check_window(std::string_view body, std::string_view key, std::int32_t value, std::int32_t again) {
  if (body.find(key) == std::string_view::npos && value != kUntouched) std::abort();
  if (value != again) std::abort();
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view body(reinterpret_cast<const char*>(data), size);
  SLibDRawMDFrameInfo frame{kUntouched, kUntouched, kUntouched, kUntouched};
  vexa::take_metadata(body, frame);
  SLibDRawMDFrameInfo again = frame;
  vexa::take_metadata(body, again);
  check_window(body, "Window1=", frame.window1, again.window1);
  check_window(body, "Window2=", frame.window2, again.window2);
  check_window(body, "Window3=", frame.window3, again.window3);
  check_window(body, "Window4=", frame.window4, again.window4);
  return 0;
}
