// SPDX-License-Identifier: Apache-2.0
#include "media/assembly/start_code.h"

#include <gtest/gtest.h>

#include <random>
#include <string>
#include <vector>

#include "tests/support/fenced_bytes.h"

namespace vexa::test {
namespace {

using CodeData = std::vector<unsigned char>;
using Finder = const unsigned char* (*)(const unsigned char*, unsigned int);

struct NamedFinder {
  const char* name;
  Finder find;
  std::size_t code_length;
};

const unsigned char* bytewise_h264(const unsigned char* data, unsigned int length) {
  return find_start_code_bytewise({data, length}, kStartCodeLengthH264);
}
const unsigned char* bytewise_mpeg4(const unsigned char* data, unsigned int length) {
  return find_start_code_bytewise({data, length}, kStartCodeLengthMpeg4);
}

constexpr NamedFinder kFinders[] = {
    {"H.264", find_start_code_h264, 4},
    {"MPEG-4", find_start_code_mpeg4, 3},
    {"H.264 byte by byte", bytewise_h264, 4},
    {"MPEG-4 byte by byte", bytewise_mpeg4, 3},
};

/// Where the code begins by the plainest reading; -1 without one.
std::ptrdiff_t expected_place(std::span<const unsigned char> data, std::size_t code_length) {
  for (std::size_t place = 0; place + code_length <= data.size(); ++place) {
    std::size_t zeros = 0;
    while (zeros + 1 < code_length && data[place + zeros] == 0) ++zeros;
    if (zeros + 1 == code_length && data[place + zeros] == 1) return static_cast<std::ptrdiff_t>(place);
  }
  return -1;
}

std::ptrdiff_t found_place(const NamedFinder& finder, std::span<const unsigned char> data) {
  const unsigned char* found = finder.find(data.data(), static_cast<unsigned int>(data.size()));
  return found == nullptr ? -1 : found - data.data();
}

void expect_as_plain(std::span<const unsigned char> data, const std::string& what) {
  for (const NamedFinder& finder : kFinders) {
    ASSERT_EQ(found_place(finder, data), expected_place(data, finder.code_length)) << finder.name << ": " << what;
  }
}

TEST(StartCode, IsFoundAtEveryPlaceOfEveryAlignmentAndLength) {
  CodeData block(96);
  for (std::size_t offset = 0; offset < 16; ++offset) {
    for (std::size_t length = 0; length <= 64; ++length) {
      const std::span<unsigned char> data(block.data() + offset, length);
      for (std::size_t place = 0; place < length; ++place) {
        std::fill(block.begin(), block.end(), 0xff);
        for (std::size_t i = 0; i < 3 && place + i < block.size() - offset; ++i) data.data()[place + i] = 0;
        block[offset + place + 3] = 1;
        expect_as_plain(data, "offset " + std::to_string(offset) + " length " + std::to_string(length) + " place " +
                                  std::to_string(place));
      }
    }
  }
}

TEST(StartCode, IsFoundInEveryMixtureOfItsBytes) {
  // Every sequence of seven of these bytes, across the border of two blocks.
  constexpr unsigned char kBytes[] = {0, 1, 2};
  alignas(16) unsigned char block[48];
  for (std::size_t mixture = 0; mixture < 2187; ++mixture) {
    for (std::size_t offset = 9; offset < 17; ++offset) {
      std::fill(std::begin(block), std::end(block), static_cast<unsigned char>(0xff));
      std::size_t rest = mixture;
      for (std::size_t i = 0; i < 7; ++i, rest /= 3) block[offset + i] = kBytes[rest % 3];
      expect_as_plain(block, "mixture " + std::to_string(mixture) + " at " + std::to_string(offset));
    }
  }
}

TEST(StartCode, IsTheFirstOfRandomBytesFullOfZeros) {
  std::mt19937 random(7);
  CodeData data(1000);
  for (int round = 0; round < 2000; ++round) {
    const std::uint32_t zeros_in_16 = 1 + static_cast<std::uint32_t>(round) % 15;
    for (unsigned char& byte : data) {
      const auto draw = static_cast<std::uint32_t>(random());
      byte = draw % 16 < zeros_in_16 ? 0 : static_cast<unsigned char>(draw >> 24 & 3);
    }
    const std::size_t from = random() % 32;
    expect_as_plain(std::span(data).subspan(from, random() % (data.size() - from)), "round " + std::to_string(round));
  }
}

TEST(StartCode, SearchReadsNothingAfterTheData) {
  for (std::size_t length = 0; length <= 80; ++length) {
    for (const int filler : {0, 1, 255}) {
      const vexa_test::FencedBytes data(CodeData(length, static_cast<unsigned char>(filler)));
      expect_as_plain(data.bytes(), "length " + std::to_string(length));
    }
  }
}

TEST(StartCode, ThreeBytesAreNoneForH264) {
  constexpr unsigned char kShort[] = {9, 0, 0, 1, 0x65, 9, 9, 9};
  EXPECT_EQ(find_start_code_h264(kShort, sizeof kShort), nullptr);
  EXPECT_EQ(find_start_code_mpeg4(kShort, sizeof kShort), kShort + 1);
}

TEST(StartCode, OfMoreZerosTheLastBelongToIt) {
  constexpr unsigned char kLong[] = {9, 0, 0, 0, 0, 1, 0xb6, 9};
  EXPECT_EQ(find_start_code_mpeg4(kLong, sizeof kLong), kLong + 3);
  EXPECT_EQ(find_start_code_h264(kLong, sizeof kLong), kLong + 2);
}

TEST(StartCode, IsNoneInNoData) {
  EXPECT_EQ(find_start_code_h264(nullptr, 0), nullptr);
  EXPECT_EQ(find_start_code_mpeg4(nullptr, 0), nullptr);
}

}  // namespace
}  // namespace vexa::test
