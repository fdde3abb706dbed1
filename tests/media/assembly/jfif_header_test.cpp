#include "media/assembly/jfif_header.h"

#include <gtest/gtest.h>

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

}  // namespace
}  // namespace vexa::test
