// SPDX-License-Identifier: Apache-2.0
#include "media/assembly/start_code.h"

#include <cstdint>

#if defined(__x86_64__) || defined(__i386__)
#include <emmintrin.h>

#include <bit>
#endif

namespace vexa {
namespace {

/// The places of data where a code may begin.
struct Places {
  const unsigned char* begin;
  const unsigned char* end;
};

bool is_code_at(const unsigned char* place, const unsigned char* data_end, std::size_t code_length) {
  if (static_cast<std::size_t>(data_end - place) < code_length) return false;
  for (std::size_t i = 0; i + 1 < code_length; ++i) {
    if (place[i] != 0) return false;
  }
  return place[code_length - 1] == 1;
}

/// The first of these places where a code begins; a code may reach beyond them, up to the data's end.
const unsigned char* find_among(Places places, const unsigned char* data_end, std::size_t code_length) {
  for (const unsigned char* place = places.begin; place != places.end; ++place) {
    if (is_code_at(place, data_end, code_length)) return place;
  }
  return nullptr;
}

#if defined(__x86_64__) || defined(__i386__)

constexpr std::size_t kBlock = 16;
constexpr unsigned int kLastOfBlock = 1U << (kBlock - 1);

/// Blocks of 16 bytes at once. A code begins with two zeros, of which the second may be in the next block: places
/// without such a pair are skipped, the others are checked. The places are whole aligned blocks.
__attribute__((target("sse2"))) const unsigned char* find_in_blocks(Places places, const unsigned char* data_end,
                                                                    std::size_t code_length) {
  const __m128i zero = _mm_setzero_si128();
  for (const unsigned char* block = places.begin; block != places.end; block += kBlock) {
    const __m128i bytes = _mm_load_si128(reinterpret_cast<const __m128i*>(block));
    const auto zeros = static_cast<unsigned int>(_mm_movemask_epi8(_mm_cmpeq_epi8(bytes, zero)));
    for (unsigned int pairs = zeros & (zeros >> 1 | kLastOfBlock); pairs != 0; pairs &= pairs - 1) {
      const unsigned char* place = block + std::countr_zero(pairs);
      if (is_code_at(place, data_end, code_length)) return place;
    }
  }
  return nullptr;
}

const unsigned char* find_start_code(Bytes data, std::size_t code_length) {
#if defined(__i386__)
  if (!__builtin_cpu_supports("sse2")) return find_start_code_bytewise(data, code_length);
#endif
  const std::size_t unaligned = -reinterpret_cast<std::uintptr_t>(data.data()) % kBlock;
  if (data.size() < unaligned + kBlock) return find_start_code_bytewise(data, code_length);
  const unsigned char* end = data.data() + data.size();
  const unsigned char* blocks = data.data() + unaligned;
  const unsigned char* tail = end - (data.size() - unaligned) % kBlock;
  if (const auto* found = find_among({data.data(), blocks}, end, code_length)) return found;
  if (const auto* found = find_in_blocks({blocks, tail}, end, code_length)) return found;
  return find_among({tail, end}, end, code_length);
}

#else

const unsigned char* find_start_code(Bytes data, std::size_t code_length) {
  return find_start_code_bytewise(data, code_length);
}

#endif

}  // namespace

const unsigned char* find_start_code_bytewise(Bytes data, std::size_t code_length) {
  const unsigned char* end = data.data() + data.size();
  return find_among({data.data(), end}, end, code_length);
}

const unsigned char* find_start_code_h264(const unsigned char* data, unsigned int length) {
  return find_start_code({data, length}, kStartCodeLengthH264);
}

const unsigned char* find_start_code_mpeg4(const unsigned char* data, unsigned int length) {
  return find_start_code({data, length}, kStartCodeLengthMpeg4);
}

}  // namespace vexa
