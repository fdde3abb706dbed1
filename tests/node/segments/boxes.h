// SPDX-License-Identifier: Apache-2.0
// Files of MP4 boxes without content.
#pragma once

#include <cstddef>
#include <string>

namespace vexa_test {

inline std::string box(const char* type, std::size_t content) {
  const std::size_t size = content + 8;
  std::string text;
  for (int shift = 24; shift >= 0; shift -= 8) text += static_cast<char>(size >> shift & 0xff);
  return text + type + std::string(content, 'x');
}

inline std::string header() { return box("ftyp", 20) + box("moov", 60); }
inline std::string fragment(std::size_t bytes) { return box("moof", 30) + box("mdat", bytes); }

}  // namespace vexa_test
