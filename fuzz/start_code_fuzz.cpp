// SPDX-License-Identifier: Apache-2.0
// Any bytes, from any place in a block on: the finders return what a search byte by byte returns. The first byte
// decides how much is left out at the front.
#include <algorithm>
#include <cstdlib>
#include <vector>

#include "media/assembly/start_code.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  // A block of its own, so that a sanitizer sees reads outside.
  const std::vector<unsigned char> bytes(data, data + size);
  const vexa::Bytes searched = vexa::Bytes(bytes).subspan(std::min<std::size_t>(size, 1 + bytes[0] % 32));
  const auto length = static_cast<unsigned int>(searched.size());
  if (vexa::find_start_code_h264(searched.data(), length) !=
      vexa::find_start_code_bytewise(searched, vexa::kStartCodeLengthH264)) {
    std::abort();
  }
  if (vexa::find_start_code_mpeg4(searched.data(), length) !=
      vexa::find_start_code_bytewise(searched, vexa::kStartCodeLengthMpeg4)) {
    std::abort();
  }
  return 0;
}
