// SPDX-License-Identifier: Apache-2.0
#include "host/serve/h264_units.h"

#include <gtest/gtest.h>

#include <string>

namespace vexa::host {
namespace {

std::string bytes(std::initializer_list<unsigned> values) {
  std::string text;
  for (const unsigned value : values) text += static_cast<char>(value);
  return text;
}

// Writes parameter sets bit by bit.
class Bits {
 public:
  Bits& put(std::uint32_t value, int count) {
    while (count-- > 0) bits_ += ((value >> count) & 1U) != 0 ? '1' : '0';
    return *this;
  }
  Bits& ue(std::uint32_t value) {
    int length = 0;
    while (((value + 1) >> length) > 1) ++length;
    return put(0, length).put(value + 1, length + 1);
  }
  std::string unit(unsigned type) {
    std::string whole(1, static_cast<char>(type));
    std::string bits = bits_ + "1";
    while (bits.size() % 8 != 0) bits += '0';
    for (std::size_t i = 0; i < bits.size(); i += 8)
      whole += static_cast<char>(std::stoi(bits.substr(i, 8), nullptr, 2));
    return whole;
  }

 private:
  std::string bits_;
};

// A set of the Main profile at level 3.1, `columns` and `rows` in macroblocks.
Bits main_set(std::uint32_t columns, std::uint32_t rows) {
  Bits in;
  in.put(77, 8)
      .put(0x40, 8)
      .put(31, 8)
      .ue(0)
      .ue(0)
      .ue(2)
      .ue(1)
      .put(0, 1)
      .ue(columns - 1)
      .ue(rows - 1)
      .put(1, 1)
      .put(1, 1);
  return in;
}

TEST(H264Units, APictureIsTakenApart) {
  const H264Picture picture =
      take_apart(bytes({0, 0, 0, 1,    9,    16,                                      // delimiter
                        0, 0, 0, 1,    0x67, 77,   64,   31,                          // sequence parameter set
                        0, 0, 1, 0x68, 0xEE, 0x3C, 0x80, 0,  0, 1, 0x0C, 0xFF, 0x80,  // filler
                        0, 0, 1, 0x65, 1,    2,    0,    0,  3, 1, 0,    0,    0,    1, 0x65, 3}));
  EXPECT_EQ(picture.sps, bytes({0x67, 77, 64, 31}));
  EXPECT_EQ(picture.pps, bytes({0x68, 0xEE, 0x3C, 0x80}));
  EXPECT_EQ(picture.samples, bytes({0, 0, 0, 7, 0x65, 1, 2, 0, 0, 3, 1, 0, 0, 0, 2, 0x65, 3}));
  EXPECT_TRUE(picture.is_idr);
}

TEST(H264Units, APictureWithoutAnIdrUnitIsNone) {
  const H264Picture picture = take_apart(bytes({0, 0, 1, 0x41, 7, 7}));
  EXPECT_FALSE(picture.is_idr);
  EXPECT_EQ(picture.samples, bytes({0, 0, 0, 3, 0x41, 7, 7}));
  EXPECT_EQ(picture.sps, "");
}

TEST(H264Units, OfNoStartCodeAndOfEmptyUnitsNothingComes) {
  for (const std::string& text : {std::string(), bytes({1, 2, 3}), bytes({0, 0, 1}), bytes({0, 0, 1, 0, 0, 1}),
                                  bytes({0, 0, 0, 0, 0, 1, 0, 0, 0})}) {
    EXPECT_EQ(take_apart(text).samples, "");
  }
}

TEST(H264Units, TheSizeIsThatOfTheParameterSetWithoutItsBorders) {
  const auto whole = size_of(main_set(80, 45).put(0, 1).unit(0x67));
  ASSERT_TRUE(whole);
  EXPECT_EQ(whole->width, 1280U);
  EXPECT_EQ(whole->height, 720U);
  // 1088 rows, of which the last eight are cropped, in units of two.
  const auto cropped = size_of(main_set(120, 68).put(1, 1).ue(0).ue(0).ue(0).ue(4).unit(0x67));
  ASSERT_TRUE(cropped);
  EXPECT_EQ(cropped->width, 1920U);
  EXPECT_EQ(cropped->height, 1080U);
}

TEST(H264Units, ASetOfTheHighProfileStatesItsChromaToo) {
  Bits in;
  in.put(100, 8).put(0, 8).put(40, 8).ue(0);
  in.ue(1).ue(0).ue(0).put(0, 1).put(1, 1);   // 4:2:0, eight bits, with scaling lists
  in.put(1, 1);                               // the first: each difference is 0
  for (int i = 0; i < 16; ++i) in.put(1, 1);  // se(0)
  in.put(0, 7);                               // none of the other seven
  in.ue(0).ue(0).ue(0).ue(1).put(0, 1).ue(19).ue(14).put(1, 1).put(1, 1).put(0, 1);
  const auto size = size_of(in.unit(0x67));
  ASSERT_TRUE(size);
  EXPECT_EQ(size->width, 320U);
  EXPECT_EQ(size->height, 240U);
}

TEST(H264Units, ASetThatIsCutOffOrOfAnImpossibleSizeIsRefused) {
  const std::string whole = main_set(80, 45).put(0, 1).unit(0x67);
  for (std::size_t length = 0; length + 1 < whole.size(); ++length)
    EXPECT_FALSE(size_of(whole.substr(0, length))) << length;
  EXPECT_FALSE(size_of(main_set(1025, 45).put(0, 1).unit(0x67)));
  EXPECT_TRUE(size_of(main_set(1024, 45).put(0, 1).unit(0x67)));
  EXPECT_FALSE(size_of(main_set(1, 1).put(1, 1).ue(4).ue(4).ue(0).ue(0).unit(0x67)));  // all of it is border
  EXPECT_FALSE(size_of(std::string(64, '\0')));
}

TEST(H264Units, TheCodecIsNamedByProfileConstraintsAndLevel) {
  EXPECT_EQ(codec_string(bytes({0x67, 0x42, 0xC0, 0x1E})), "avc1.42C01E");
  EXPECT_EQ(codec_string(bytes({0x67, 0x4D, 0x40, 0x1F})), "avc1.4D401F");
  EXPECT_EQ(codec_string(bytes({0x67, 0x64, 0x00, 0x28})), "avc1.640028");
  EXPECT_EQ(codec_string(bytes({0x67, 0x64, 0x00})), "");
}

}  // namespace
}  // namespace vexa::host
