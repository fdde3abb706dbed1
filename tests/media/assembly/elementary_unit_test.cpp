#include "media/assembly/elementary_unit.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace vexa {
namespace {

std::vector<unsigned char> unit_with(std::initializer_list<unsigned char> code, unsigned char kind) {
  std::vector<unsigned char> unit = code;
  unit.push_back(kind);
  return unit;
}

TEST(ElementaryUnit, OfH264IsKnownByTheLowFiveBitsAfterItsStartCode) {
  for (int byte = 0; byte < 256; ++byte) {
    const int type = byte & 31;
    const UnitKind expected = type == 1 || type == 5 ? UnitKind::kPicture
                              : type == 6            ? UnitKind::kUserData
                              : type == 7            ? UnitKind::kKeyHeader
                                                     : UnitKind::kOther;
    EXPECT_EQ(kH264Elementary.kind_of(unit_with({0, 0, 0, 1}, static_cast<unsigned char>(byte))), expected) << byte;
  }
}

TEST(ElementaryUnit, OfMpeg4IsKnownByTheByteAfterItsStartCode) {
  for (int byte = 0; byte < 256; ++byte) {
    const UnitKind expected = byte == 0xb6   ? UnitKind::kPicture
                              : byte == 0xb2 ? UnitKind::kUserData
                              : byte == 0xb0 ? UnitKind::kKeyHeader
                                             : UnitKind::kOther;
    EXPECT_EQ(kMpeg4Elementary.kind_of(unit_with({0, 0, 1}, static_cast<unsigned char>(byte))), expected) << byte;
  }
}

TEST(ElementaryUnit, CutShortIsAnyOther) {
  const unsigned char bytes[] = {0, 0, 0, 1};
  for (std::size_t length = 0; length <= 4; ++length) {
    EXPECT_EQ(kH264Elementary.kind_of(Bytes(bytes, length)), UnitKind::kOther);
  }
  const unsigned char mpeg4[] = {0, 0, 1};
  for (std::size_t length = 0; length <= 3; ++length) {
    EXPECT_EQ(kMpeg4Elementary.kind_of(Bytes(mpeg4, length)), UnitKind::kOther);
  }
}

TEST(ElementaryUnit, TextBeginsAfterItsHead) {
  const std::string unit = "0123456789abcdef";
  for (std::size_t length = 0; length <= unit.size(); ++length) {
    const Bytes bytes(reinterpret_cast<const unsigned char*>(unit.data()), length);
    const auto text = [&](const ElementaryCodec& codec) {
      const Bytes found = codec.text_of(bytes);
      return std::string(found.begin(), found.end());
    };
    EXPECT_EQ(text(kH264Elementary), length > 11 ? unit.substr(11, length - 11) : "");
    EXPECT_EQ(text(kMpeg4Elementary), length > 4 ? unit.substr(4, length - 4) : "");
  }
}

}  // namespace
}  // namespace vexa
