// SPDX-License-Identifier: Apache-2.0
// Secrets are overwritten before their memory is given back: it may be handed to somebody else, or end in a core file.
#pragma once

#include <cstddef>
#include <string>

namespace vexa {

/// Overwrites the bytes, also where nobody reads them afterwards.
inline void wipe(char* bytes, std::size_t count) {
  volatile char* const written = bytes;
  for (std::size_t i = 0; i < count; ++i) written[i] = '\0';
}

/// Overwrites all that the text has room for, and leaves it empty.
inline void wipe(std::string& text) {
  text.resize(text.capacity());
  wipe(text.data(), text.size());
  text.clear();
}

/// Wipes a text of its owner's when its scope ends.
class WipedAtEnd {
 public:
  explicit WipedAtEnd(std::string& text) : text_(text) {}
  ~WipedAtEnd() { wipe(text_); }
  WipedAtEnd(const WipedAtEnd&) = delete;
  WipedAtEnd& operator=(const WipedAtEnd&) = delete;

 private:
  std::string& text_;
};

}  // namespace vexa
