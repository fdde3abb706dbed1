// SPDX-License-Identifier: Apache-2.0
// Base64 (RFC 4648), and a decoder that takes what cameras send.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace vexa {

/// The standard alphabet, padded with "=" to whole groups of four.
std::string base64_encode(std::string_view bytes);

/// Decodes whole groups of four characters to three bytes each; a shorter tail is ignored. "=" and every character
/// outside the alphabet count as 0.
std::vector<unsigned char> base64_decode(std::string_view text);

}  // namespace vexa
