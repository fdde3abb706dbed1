// SPDX-License-Identifier: Apache-2.0
// What the fuzz targets share: a condition that must hold, and the input as a text.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string_view>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

namespace vexa_fuzz {

/// Ends the program, which the fuzzer reports with the input.
inline void check(bool holds) {
  if (!holds) std::abort();
}

inline std::string_view text_of(const std::uint8_t* data, std::size_t size) {
  return {reinterpret_cast<const char*>(data), size};
}

}  // namespace vexa_fuzz
