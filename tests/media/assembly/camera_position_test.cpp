#include "media/assembly/camera_position.h"

#include <gtest/gtest.h>

#include <string>

#include "tests/support/fenced_bytes.h"

namespace vexa::test {
namespace {

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
}  // namespace vexa::test
