// SPDX-License-Identifier: Apache-2.0
#include "media/assembly/jfif_header.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <numeric>
#include <set>
#include <vector>

namespace vexa::test {
namespace {

using HeaderBytes = std::vector<unsigned char>;

constexpr std::size_t kWithoutRestart = 605;

HeaderBytes header_of(const JpegShape& shape) {
  HeaderBytes bytes(1000);
  FrameWriter writer(bytes);
  append_jfif_header(writer, shape, quantisation_tables(50));
  EXPECT_TRUE(writer.fits());
  bytes.resize(writer.length());
  return bytes;
}

HeaderBytes part_of(const HeaderBytes& bytes, std::size_t from, std::size_t length) {
  const auto begin = bytes.begin() + static_cast<std::ptrdiff_t>(from);
  return {begin, begin + static_cast<std::ptrdiff_t>(length)};
}

TEST(JfifHeader, IsExactByteForByte) {
  const HeaderBytes header = header_of({80, 60, 0});
  ASSERT_EQ(header.size(), kWithoutRestart);
  EXPECT_EQ(part_of(header, 0, 9), (HeaderBytes{0xff, 0xd8, 0xff, 0xdb, 0, 0x43, 0, 16, 11}));
  EXPECT_EQ(part_of(header, 71, 7), (HeaderBytes{0xff, 0xdb, 0, 0x43, 1, 17, 18}));
  EXPECT_EQ(part_of(header, 140, 19),
            (HeaderBytes{0xff, 0xc0, 0, 0x11, 8, 1, 0xe0, 2, 0x80, 3, 0, 0x22, 0, 1, 0x11, 1, 2, 0x11, 1}));
  EXPECT_EQ(part_of(header, 159, 9), (HeaderBytes{0xff, 0xc4, 0, 31, 0x00, 0, 1, 5, 1}));
  EXPECT_EQ(part_of(header, 180, 12), (HeaderBytes{0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11}));
  EXPECT_EQ(part_of(header, 192, 9), (HeaderBytes{0xff, 0xc4, 0, 181, 0x10, 0, 2, 1, 3}));
  EXPECT_EQ(part_of(header, 375, 9), (HeaderBytes{0xff, 0xc4, 0, 31, 0x01, 0, 3, 1, 1}));
  EXPECT_EQ(part_of(header, 408, 9), (HeaderBytes{0xff, 0xc4, 0, 181, 0x11, 0, 2, 1, 2}));
  EXPECT_EQ(part_of(header, 591, 14), (HeaderBytes{0xff, 0xda, 0, 0x0c, 3, 0, 0, 1, 0x11, 2, 0x11, 0, 0x3f, 0}));
}

TEST(JfifHeader, HasARestartIntervalBetweenTablesAndFrame) {
  for (const std::uint16_t interval : {std::uint16_t{1}, std::uint16_t{0x1234}, std::uint16_t{0xffff}}) {
    const HeaderBytes header = header_of({80, 60, interval});
    ASSERT_EQ(header.size(), kWithoutRestart + 6);
    EXPECT_EQ(part_of(header, 140, 8), (HeaderBytes{0xff, 0xdd, 0, 4, static_cast<unsigned char>(interval >> 8),
                                                    static_cast<unsigned char>(interval), 0xff, 0xc0}));
  }
}

TEST(JfifHeader, HasSizesFromZeroTo2040) {
  EXPECT_EQ(part_of(header_of({0, 0, 0}), 145, 4), (HeaderBytes{0, 0, 0, 0}));
  EXPECT_EQ(part_of(header_of({1, 2, 0}), 145, 4), (HeaderBytes{0, 16, 0, 8}));
  EXPECT_EQ(part_of(header_of({255, 255, 0}), 145, 4), (HeaderBytes{7, 0xf8, 7, 0xf8}));
}

TEST(JfifHeader, IsNotCutForLackOfRoom) {
  for (const std::size_t room : {std::size_t{0}, std::size_t{1}, std::size_t{300}, kWithoutRestart - 1}) {
    HeaderBytes bytes(room);
    FrameWriter writer(bytes);
    append_jfif_header(writer, {80, 60, 0}, quantisation_tables(50));
    EXPECT_FALSE(writer.fits()) << room;
  }
}

TEST(QuantisationTables, Quality50GivesTheBaseTables) {
  const QuantisationTables base = quantisation_tables(50);
  const unsigned char luminance_rows[] = {16, 11, 10, 16, 24, 40, 51, 61, 12, 12, 14, 19, 26, 58, 60, 55};
  const unsigned char chrominance_rows[] = {17, 18, 24, 47, 99, 99, 99, 99, 18, 21, 26, 66, 99, 99, 99, 99};
  EXPECT_TRUE(std::equal(std::begin(luminance_rows), std::end(luminance_rows), base.luminance.begin()));
  EXPECT_TRUE(std::equal(std::begin(chrominance_rows), std::end(chrominance_rows), base.chrominance.begin()));
  EXPECT_EQ(base.luminance.back(), 99);
  EXPECT_EQ(std::accumulate(base.luminance.begin(), base.luminance.end(), 0), 3688);
  EXPECT_EQ(std::accumulate(base.chrominance.begin(), base.chrominance.end(), 0), 5505);
}

TEST(QuantisationTables, StandInRowsNotInZigZag) {
  const QuantisationTables base = quantisation_tables(50);
  EXPECT_EQ(base.luminance[2], 10);  // by zig-zag it were 12
  EXPECT_EQ(base.luminance[8], 12);  // by zig-zag it were 10
}

TEST(QuantisationTables, AreScaledByQuality) {
  struct {
    std::uint8_t q;
    int luminance_first;   // of base 16
    int luminance_third;   // of base 10
    int chrominance_last;  // of base 99
  } const cases[] = {
      {0, 255, 255, 255},  // as 1
      {1, 255, 255, 255}, {2, 255, 250, 255}, {3, 255, 167, 255},
      {10, 80, 50, 255},  {25, 32, 20, 198},  {49, 16, 10, 101},  // 5000 / 49 is 102
      {50, 16, 10, 99},   {51, 16, 10, 97},   {75, 8, 5, 50},
      {98, 1, 1, 4},      {99, 1, 1, 2},      {100, 1, 1, 2},  // as 99
      {127, 1, 1, 2},
  };
  for (const auto& c : cases) {
    const QuantisationTables tables = quantisation_tables(c.q);
    EXPECT_EQ(tables.luminance[0], c.luminance_first) << int{c.q};
    EXPECT_EQ(tables.luminance[2], c.luminance_third) << int{c.q};
    EXPECT_EQ(tables.chrominance[63], c.chrominance_last) << int{c.q};
  }
}

TEST(QuantisationTables, HaveNoEntryOfZeroAtAnyQuality) {
  for (int q = 0; q < 128; ++q) {
    const QuantisationTables tables = quantisation_tables(static_cast<std::uint8_t>(q));
    EXPECT_GE(*std::min_element(tables.luminance.begin(), tables.luminance.end()), 1) << q;
    EXPECT_GE(*std::min_element(tables.chrominance.begin(), tables.chrominance.end()), 1) << q;
  }
}

TEST(HuffmanTables, HoldAsManySymbolsAsTheyCountAndNoneTwice) {
  const std::size_t sizes[] = {12, 162, 12, 162};
  const int destinations[] = {0x00, 0x10, 0x01, 0x11};
  for (std::size_t i = 0; i < kHuffmanTables.size(); ++i) {
    const HuffmanTable& table = kHuffmanTables[i];
    EXPECT_EQ(table.destination, destinations[i]);
    EXPECT_EQ(table.symbols.size(), sizes[i]);
    EXPECT_EQ(std::accumulate(table.code_counts.begin(), table.code_counts.end(), std::size_t{0}), sizes[i]);
    EXPECT_EQ(std::set<unsigned char>(table.symbols.begin(), table.symbols.end()).size(), sizes[i]);
  }
}

}  // namespace
}  // namespace vexa::test
