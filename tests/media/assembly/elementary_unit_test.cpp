// SPDX-License-Identifier: Apache-2.0
#include "media/assembly/elementary_unit.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/support/fenced_bytes.h"

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

const std::string kTwentyFour = "CamPos: 0123456789abcdef";

Bytes bytes_of_text(const std::string& text) {
  return {reinterpret_cast<const unsigned char*>(text.data()), text.size()};
}

TEST(CameraPosition, IsTheTwentyFourCharactersFromItsKeyOn) {
  struct {
    const char* what;
    std::string data;
    std::optional<std::string> position;
  } const cases[] = {
      {"the text alone", kTwentyFour, kTwentyFour},
      {"one character more", kTwentyFour + "g", kTwentyFour},
      {"one character less", kTwentyFour.substr(0, 23), kTwentyFour.substr(0, 23)},
      {"the key alone", "CamPos: ", "CamPos: "},
      {"a key cut short", "CamPos:", std::nullopt},
      {"other letters", "campos: 12", std::nullopt},
      {"the first of two", "CamPos: 1" + std::string(30, '.') + "CamPos: 2", "CamPos: 1..............."},
      {"a beginning that goes wrong", "CamCamPos: 5", "CamPos: 5"},
      {"zeros before it", std::string(9, '\0') + kTwentyFour, kTwentyFour},
      {"zeros in it", "CamPos: 1" + std::string(30, '\0'), "CamPos: 1" + std::string(15, '\0')},
      {"nothing", "", std::nullopt},
  };
  for (const auto& c : cases) {
    const vexa_test::FencedBytes data(bytes_of_text(c.data));
    const auto position = camera_position(data.bytes());
    EXPECT_EQ(position ? std::optional<std::string>(*position) : std::nullopt, c.position) << c.what;
  }
}

TEST(CameraPosition, OfUserDataIsSearchedInTheFirst256Bytes) {
  for (const auto& [before, length] : {std::pair{231, 24}, {232, 24}, {233, 23}, {248, 8}}) {
    const std::string data = std::string(static_cast<std::size_t>(before), 'x') + kTwentyFour;
    const auto position = camera_position(front_of_user_data(bytes_of_text(data)));
    ASSERT_TRUE(position) << before;
    EXPECT_EQ(*position, kTwentyFour.substr(0, static_cast<std::size_t>(length))) << before;
  }
  const std::string behind = std::string(249, 'x') + kTwentyFour;
  EXPECT_FALSE(camera_position(front_of_user_data(bytes_of_text(behind))));
}

TEST(CameraPosition, FrontOfUserDataIsAllOfItUpTo256Bytes) {
  const std::string data(300, 'x');
  for (const std::size_t length : {0u, 255u, 256u, 257u, 300u}) {
    EXPECT_EQ(front_of_user_data(bytes_of_text(data).first(length)).size(), std::min<std::size_t>(length, 256));
  }
}

}  // namespace
}  // namespace vexa
