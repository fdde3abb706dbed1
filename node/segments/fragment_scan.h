// SPDX-License-Identifier: Apache-2.0
// How much of a fragmented MP4 file is whole.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>

namespace vexa::node {

struct FragmentScan {
  std::uint64_t whole = 0;      ///< bytes up to the end of the last whole fragment; 0 without a whole header
  std::uint64_t fragments = 0;  ///< whole ones: a "moof" box with its "mdat"
};

/// Reads `length` bytes at `at`: false where the file has not so many.
using ReadAt = std::function<bool(std::uint64_t at, unsigned char* bytes, std::size_t length)>;

/// Reads the headers of the boxes of the first level alone. What follows the first box that is not whole, or is none,
/// is not looked at.
[[nodiscard]] FragmentScan scan_fragments(const ReadAt& read, std::uint64_t file_size);

}  // namespace vexa::node
