// SPDX-License-Identifier: Apache-2.0
#include "host/words/setting_words.h"

#include <gtest/gtest.h>

namespace vexa::host {
namespace {

std::string refusal_of(const std::vector<std::string>& texts) {
  const Result<SettingChanges> changes = parse_changes(texts);
  return changes ? "taken" : changes.error().text + " | " + changes.error().advice;
}

TEST(SettingWords, ReadsEverySetting) {
  const auto parsed =
      parse_changes({"codec=H.264", "size=1280x720", "frame-rate=25", "bit-rate=4000", "quality=5", "rotation=180",
                     "day-night=night", "noise-reduction=mid", "wide-dynamic-range=on", "visibility-enhancer=low",
                     "infrared=daynight", "infrared-strength=7", "back-light=off", "exposure=Iris Priority"});
  ASSERT_TRUE(parsed) << parsed.error().text;
  const auto& changes = *parsed;
  EXPECT_EQ(changes.codec, Codec::kH264);
  EXPECT_EQ(changes.size->text, "1280x720");
  EXPECT_EQ(changes.size->width, 1280);
  EXPECT_EQ(changes.size->height, 720);
  EXPECT_EQ(changes.frame_rate, 25);
  EXPECT_EQ(changes.bit_rate, 4000);
  EXPECT_EQ(changes.quality, 5);
  EXPECT_EQ(changes.rotation, 180);
  EXPECT_EQ(changes.day_night, LIBD_DAYNIGHT_NIGHT);
  EXPECT_EQ(changes.noise_reduction, LIBD_XDNR_MIDDLE);
  EXPECT_EQ(changes.dynamic_range, LIBD_VIEWDR_ON);
  EXPECT_EQ(changes.visibility, LIBD_VISIBILITY_LOW);
  EXPECT_EQ(changes.infrared, LIB_IR_DAYNIGHT);
  EXPECT_EQ(changes.infrared_strength, 7);
  EXPECT_EQ(changes.back_light, false);
  EXPECT_EQ(changes.exposure, "Iris Priority");
  EXPECT_TRUE(changes.of_stream());
}

TEST(SettingWords, SayWhatASettingTakes) {
  const struct {
    const char* text;
    const char* refusal;
  } cases[] = {
      {"codec", "\"codec\" is not KEY=VALUE | For instance: codec=H.264 size=1280x720."},
      {"=1",
       "unknown setting \"\" | The settings are: codec, size, frame-rate, bit-rate, quality, rotation, day-night, "
       "noise-reduction, wide-dynamic-range, visibility-enhancer, infrared, infrared-strength, back-light, exposure."},
      {"codec=h264", "the value of codec cannot be used | It takes JPEG, MPEG4 or H.264."},
      {"codec=", "the value of codec cannot be used | It takes JPEG, MPEG4 or H.264."},
      {"size=1280", "the value of size cannot be used | It takes WIDTHxHEIGHT in pixels, such as 640x480."},
      {"size=1280x", "the value of size cannot be used | It takes WIDTHxHEIGHT in pixels, such as 640x480."},
      {"size=0x480", "the value of size cannot be used | It takes WIDTHxHEIGHT in pixels, such as 640x480."},
      {"size=640x10000", "the value of size cannot be used | It takes WIDTHxHEIGHT in pixels, such as 640x480."},
      {"size=640x480x", "the value of size cannot be used | It takes WIDTHxHEIGHT in pixels, such as 640x480."},
      {"frame-rate=0", "the value of frame-rate cannot be used | It takes frames per second, 1 to 60."},
      {"frame-rate=61", "the value of frame-rate cannot be used | It takes frames per second, 1 to 60."},
      {"frame-rate=25 ", "the value of frame-rate cannot be used | It takes frames per second, 1 to 60."},
      {"bit-rate=99999999999", "the value of bit-rate cannot be used | It takes kbit/s, 1 to 100000; not for JPEG."},
      {"rotation=360",
       "the value of rotation cannot be used | It takes degrees, 0 to 359; 180 turns the picture where the camera "
       "can, left out: 0."},
      {"day-night=AUTO", "the value of day-night cannot be used | It takes auto, day or night."},
      {"noise-reduction=middle", "the value of noise-reduction cannot be used | It takes off, low, mid or high."},
      {"back-light=1", "the value of back-light cannot be used | It takes on or off."},
      {"exposure=full",
       "the value of exposure cannot be used | It takes \"Full auto\", \"Shutter Priority\" or \"Iris Priority\"."},
  };
  for (const auto& c : cases) EXPECT_EQ(refusal_of({c.text}), c.refusal) << c.text;
  EXPECT_EQ(refusal_of({"quality=1", "quality=1"}), "quality is given twice | Give each setting once.");
}

}  // namespace
}  // namespace vexa::host
