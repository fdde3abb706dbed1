// SPDX-License-Identifier: Apache-2.0
// The kind of a file, by the end of its name.
#ifndef HOST_BASE_FILE_EXTENSION_H_
#define HOST_BASE_FILE_EXTENSION_H_

#include <algorithm>
#include <cstddef>
#include <string_view>

namespace vexa::host {

// Whether a file's name ends with this extension, in capitals too. `extension` is in small letters, as ".mkv"; a name
// that is only an extension does not have it.
[[nodiscard]] inline bool has_extension(std::string_view file, std::string_view extension) {
  if (file.size() <= extension.size()) return false;
  const auto small = [](char letter) {
    return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter + 32) : letter;
  };
  return std::equal(extension.begin(), extension.end(), file.end() - static_cast<std::ptrdiff_t>(extension.size()),
                    [small](char wanted, char letter) { return wanted == small(letter); });
}

}  // namespace vexa::host

#endif  // HOST_BASE_FILE_EXTENSION_H_
