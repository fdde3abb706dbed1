// SPDX-License-Identifier: Apache-2.0
#include "node/core/rendezvous.h"

#include <bit>
#include <limits>

namespace vexa::node {
namespace {

constexpr int kFractionBits = 24;

// Every bit of the value reaches every bit of the result.
constexpr std::uint64_t mix(std::uint64_t value) {
  value ^= value >> 30;
  value *= 0xbf58476d1ce4e5b9U;
  value ^= value >> 27;
  value *= 0x94d049bb133111ebU;
  return value ^ (value >> 31);
}

// -log2 of a fraction of 2^64, in units of 2^-24: above 0 and at most 64. The logarithm's digits come one by one, by
// squaring.
constexpr std::uint64_t negative_log2(std::uint64_t fraction) {
  fraction |= 1;
  const int zeros = std::countl_zero(fraction);
  std::uint64_t mantissa = (fraction << zeros) >> 32;  // from 1 up to 2, in units of 2^-31
  std::uint64_t digits = 0;
  for (int i = 0; i < kFractionBits; ++i) {
    mantissa = (mantissa * mantissa) >> 31;
    const std::uint64_t carry = mantissa >> 32;
    digits = digits << 1 | carry;
    mantissa >>= carry;
  }
  return (static_cast<std::uint64_t>(zeros + 1) << kFractionBits) - digits;
}

static_assert(negative_log2(std::uint64_t{1} << 63) == 1U << kFractionBits, "log2 of a half is -1");
static_assert(negative_log2(0) == std::uint64_t{64} << kFractionBits);
static_assert(negative_log2(~std::uint64_t{0}) == 1);

}  // namespace

std::uint64_t name_hash(std::string_view name) {
  std::uint64_t hash = 0xcbf29ce484222325U;
  for (const char c : name) {
    hash ^= static_cast<unsigned char>(c);
    hash *= 0x100000001b3U;
  }
  return mix(hash);
}

std::uint64_t rendezvous_cost(std::uint64_t camera, std::uint64_t node, std::uint32_t capacity) {
  if (capacity == 0) return std::numeric_limits<std::uint64_t>::max();
  return (negative_log2(mix(camera + 0x9e3779b97f4a7c15U * (node | 1))) << 32) / capacity;
}

}  // namespace vexa::node
