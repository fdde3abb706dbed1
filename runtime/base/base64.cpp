// SPDX-License-Identifier: Apache-2.0
#include "runtime/base/base64.h"

#include <array>
#include <cstddef>
#include <cstdint>

namespace vexa {
namespace {

constexpr std::string_view kAlphabet = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
constexpr std::size_t kGroupBytes = 3;
constexpr std::size_t kGroupCharacters = 4;

constexpr std::array<std::uint8_t, 256> make_values() {
  std::array<std::uint8_t, 256> values{};
  for (std::size_t i = 0; i < kAlphabet.size(); ++i) {
    values[static_cast<unsigned char>(kAlphabet[i])] = static_cast<std::uint8_t>(i);
  }
  return values;
}

constexpr std::array<std::uint8_t, 256> kValues = make_values();

}  // namespace

std::string base64_encode(std::string_view bytes) {
  std::string text;
  text.reserve((bytes.size() + kGroupBytes - 1) / kGroupBytes * kGroupCharacters);
  for (std::size_t at = 0; at < bytes.size(); at += kGroupBytes) {
    const std::string_view group = bytes.substr(at, kGroupBytes);
    std::uint32_t bits = 0;
    for (std::size_t i = 0; i < kGroupBytes; ++i) {
      bits = bits << 8 | (i < group.size() ? static_cast<unsigned char>(group[i]) : 0U);
    }
    for (std::size_t i = 0; i < kGroupCharacters; ++i) {
      text += i <= group.size() ? kAlphabet[bits >> (18 - 6 * i) & 0x3f] : '=';
    }
  }
  return text;
}

std::vector<unsigned char> base64_decode(std::string_view text) {
  std::vector<unsigned char> bytes;
  bytes.reserve(text.size() / kGroupCharacters * kGroupBytes);
  for (; text.size() >= kGroupCharacters; text.remove_prefix(kGroupCharacters)) {
    std::uint32_t bits = 0;
    for (const char c : text.substr(0, kGroupCharacters)) bits = bits << 6 | kValues[static_cast<unsigned char>(c)];
    for (const unsigned shift : {16U, 8U, 0U}) bytes.push_back(static_cast<unsigned char>(bits >> shift));
  }
  return bytes;
}

}  // namespace vexa
