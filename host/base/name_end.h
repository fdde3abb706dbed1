// The kind of file that a name tells by its end.
#ifndef HOST_BASE_NAME_END_H_
#define HOST_BASE_NAME_END_H_

#include <algorithm>
#include <cstddef>
#include <string_view>

namespace vexa::host {

// Whether a file's name ends like this, in capitals too, behind something. `end` is in small letters.
[[nodiscard]] inline bool has_end(std::string_view file, std::string_view end) {
  if (file.size() <= end.size()) return false;
  const auto small = [](char letter) {
    return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter + 32) : letter;
  };
  return std::equal(end.begin(), end.end(), file.end() - static_cast<std::ptrdiff_t>(end.size()),
                    [small](char wanted, char letter) { return wanted == small(letter); });
}

}  // namespace vexa::host

#endif  // HOST_BASE_NAME_END_H_
