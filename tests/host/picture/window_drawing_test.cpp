// SPDX-License-Identifier: Apache-2.0
// Detection windows drawn on a picture.
#include "host/picture/picture.h"

#include <gtest/gtest.h>

#include <limits>
#include <string>

namespace vexa::host {
namespace {

Picture black_picture(int width, int height) {
  return {width, height, std::vector<std::uint8_t>(static_cast<std::size_t>(3 * width * height))};
}

SLibDDetectionParam one_window(std::size_t number, std::int32_t x1, std::int32_t y1, std::int32_t x2, std::int32_t y2) {
  SLibDDetectionParam setting;
  SLibDDetectionWindow& window = setting.windows[number - 1];
  window.area = {{x1, y1}, {x2, y2}};
  window.enabled = 1;
  window.mode = 0;
  return setting;
}

// The picture in letters: the colours of windows 1 to 4, "#" for a digit's black on them, "." for what was there.
std::string map_of(const Picture& picture) {
  std::string map;
  for (int y = 0; y < picture.height; ++y) {
    for (int x = 0; x < picture.width; ++x) {
      const std::uint8_t* pixel = &picture.rgb[static_cast<std::size_t>(3 * (y * picture.width + x))];
      const int sum = pixel[0] + pixel[1] + pixel[2];
      map += sum == 0 ? '.' : pixel[0] == 64 ? (pixel[1] == 255 ? '2' : '3') : pixel[2] == 64 ? '1' : '4';
    }
    map += '\n';
  }
  return map;
}

TEST(WindowDrawing, AWindowIsAFrameWithItsNumber) {
  Picture picture = black_picture(20, 14);
  draw_windows(picture, one_window(2, 1000, 1000, 9000, 9999));
  EXPECT_EQ(map_of(picture),
            "....................\n"
            "..22222222222222222.\n"
            "..22...222222222222.\n"
            "..2.222.2........22.\n"
            "..22222.2........22.\n"
            "..2222.22........22.\n"
            "..222.222........22.\n"
            "..22.2222........22.\n"
            "..2.....2........22.\n"
            "..2222222........22.\n"
            "..22.............22.\n"
            "..22.............22.\n"
            "..22222222222222222.\n"
            "..22222222222222222.\n");
}

TEST(WindowDrawing, AWindowSwitchedOffIsThinAndAMaskIsCrossed) {
  Picture picture = black_picture(30, 20);
  SLibDDetectionParam setting = one_window(3, 3000, 2000, 8000, 8000);
  setting.windows[2].enabled = 0;
  setting.windows[2].mode = 1;
  draw_windows(picture, setting);
  EXPECT_EQ(map_of(picture),
            "..............................\n"
            "..............................\n"
            "..............................\n"
            "..............................\n"
            ".........3333333333333333.....\n"
            ".........3.....3.......33.....\n"
            ".........3333.33......3.3.....\n"
            ".........333.333.....3..3.....\n"
            ".........3333.33...33...3.....\n"
            ".........33333.33.3.....3.....\n"
            ".........3.333.3.3......3.....\n"
            ".........33...333.3.....3.....\n"
            ".........3333333...33...3.....\n"
            ".........3...3.......3..3.....\n"
            ".........3..3.........3.3.....\n"
            ".........3.3...........33.....\n"
            ".........3333333333333333.....\n"
            "..............................\n"
            "..............................\n"
            "..............................\n");
}

TEST(WindowDrawing, ADigitGrowsWithThePicture) {
  Picture picture = black_picture(960, 480);
  draw_windows(picture, one_window(1, 0, 0, 10000, 10000));
  const std::string map = map_of(picture);
  std::size_t coloured = 0;
  for (int x = 0; x < 14; ++x) coloured += map[static_cast<std::size_t>(17 * 961 + x)] == '1';
  EXPECT_EQ(coloured, 14U);
}

TEST(WindowDrawing, WindowsWithoutAnAreaAreLeftOut) {
  Picture picture = black_picture(20, 20);
  const Picture before = picture;
  draw_windows(picture, SLibDDetectionParam());
  draw_windows(picture, one_window(1, 0, 0, 0, 0));
  draw_windows(picture, one_window(1, 100, 0, 100, 9999));
  SLibDDetectionParam three_points = one_window(1, 0, 0, 5000, 5000);
  three_points.windows[0].area.push_back({1, 1});
  draw_windows(picture, three_points);
  EXPECT_EQ(picture.rgb, before.rgb);
}

TEST(WindowDrawing, CornersMayComeInAnyOrder) {
  Picture one = black_picture(40, 40);
  Picture other = black_picture(40, 40);
  draw_windows(one, one_window(4, 1000, 2000, 9000, 8000));
  draw_windows(other, one_window(4, 9000, 8000, 1000, 2000));
  EXPECT_EQ(map_of(one), map_of(other));
}

// A camera's numbers are not trusted, and its picture may be a single pixel.
TEST(WindowDrawing, WhatLiesOutsideThePictureIsCutOff) {
  constexpr std::int32_t kLeast = std::numeric_limits<std::int32_t>::min();
  constexpr std::int32_t kMost = std::numeric_limits<std::int32_t>::max();
  for (const int width : {1, 2, 3, 31}) {
    for (const int height : {1, 2, 29}) {
      Picture picture = black_picture(width, height);
      draw_windows(picture, one_window(1, kLeast, kLeast, kMost, kMost));
      draw_windows(picture, one_window(2, 9999, 9999, kMost, kMost));
      SLibDDetectionParam mask = one_window(3, -1, 10001, 10000, kLeast);
      mask.windows[2].mode = 7;
      draw_windows(picture, mask);
      EXPECT_EQ(picture.rgb.size(), static_cast<std::size_t>(3 * width * height));
    }
  }
  Picture none;
  draw_windows(none, one_window(1, 0, 0, 5000, 5000));
  EXPECT_TRUE(none.rgb.empty());
}

}  // namespace
}  // namespace vexa::host
