// SPDX-License-Identifier: Apache-2.0
// The start codes between the units of a byte stream: 00 00 00 01 (H.264, Annex B) and 00 00 01 (MPEG-4 Visual).
#pragma once

#include <cstddef>

#include "runtime/base/bytes.h"

namespace vexa {

constexpr unsigned int kStartCodeLengthH264 = 4;
constexpr unsigned int kStartCodeLengthMpeg4 = 3;

/// The first byte of the first 00 00 00 01 in the data; null when there is none. Reads nothing outside the data.
const unsigned char* find_start_code_h264(const unsigned char* data, unsigned int length);

/// The same for 00 00 01. Of more zeros the last two belong to it.
const unsigned char* find_start_code_mpeg4(const unsigned char* data, unsigned int length);

/// The same for `code_length` - 1 zeros and a 1, byte by byte: what a processor without vectors runs.
const unsigned char* find_start_code_bytewise(Bytes data, std::size_t code_length);

}  // namespace vexa
