// SPDX-License-Identifier: Apache-2.0
#include "device/cgi/audio_text.h"

#include <gtest/gtest.h>

#include <climits>

namespace vexa {
namespace {

TEST(AudioCodec, TakesCodecBitRateAndFrameSizeOfEveryWord) {
  const struct {
    const char* value;
    const char* codec;
    const char* bit_rate_label;
    std::int32_t bit_rate;
    const char* frame_size_label;
    std::int32_t frame_size;
  } cases[] = {{"g711_64", "G711", "64 Kbps", 64000, "1280 bytes", 1280},
               {"g726_40", "G726", "40 Kbps", 40000, "800 bytes", 800},
               {"g726_32", "G726", "32 Kbps", 32000, "640 bytes", 640},
               {"g726_24", "G726", "24 Kbps", 24000, "480 bytes", 480},
               {"g726_16", "G726", "16 Kbps", 16000, "320 bytes", 320}};
  for (const auto& c : cases) {
    SLibDAudioInfo info;
    take_audio_codec(c.value, info);
    EXPECT_EQ(info.codec, c.codec);
    EXPECT_EQ(info.bitRateLabel, c.bit_rate_label);
    EXPECT_EQ(info.bitRate, c.bit_rate);
    EXPECT_EQ(info.frameSizeLabel, c.frame_size_label);
    EXPECT_EQ(info.frameSize, c.frame_size);
    EXPECT_EQ(info.samplingRateLabel, "none");
  }
}

TEST(AudioCodec, OfAnUnknownWordChangesNothing) {
  for (const char* value : {"", "g711", "G711_64", "g711_640", "g726_64", " g711_64", "aac"}) {
    SLibDAudioInfo info;
    info.codec = "kept";
    info.bitRate = 1;
    take_audio_codec(value, info);
    EXPECT_EQ(info.codec, "kept") << value;
    EXPECT_EQ(info.bitRate, 1) << value;
    EXPECT_EQ(info.frameSizeLabel, "none") << value;
  }
}

std::string word_for(const char* codec, std::int32_t bit_rate) {
  SLibDAudioInfo info;
  info.codec = codec;
  info.bitRate = bit_rate;
  return audio_codec_word(info);
}

TEST(AudioCodecWord, CarriesTheBitRateOfG726InWholeKilobits) {
  EXPECT_EQ(word_for("G726", 40000), "g726_40");
  EXPECT_EQ(word_for("G726", 24000), "g726_24");
  EXPECT_EQ(word_for("G726", 24999), "g726_24");
  EXPECT_EQ(word_for("G726", 999), "g726_0");
  EXPECT_EQ(word_for("G726", -24999), "g726_-24");
  EXPECT_EQ(word_for("G726", INT_MIN), "g726_-2147483");
}

TEST(AudioCodecWord, AsksForG711WhenTheCodecIsNotExactlyG726) {
  for (const char* codec : {"G711", "g726", "G726 ", "", "none"}) EXPECT_EQ(word_for(codec, 24000), "g711_64") << codec;
}

TEST(AudioCodecType, IsTheNumberOfItsCodec) {
  EXPECT_EQ(audio_codec_type("G711"), 10);
  EXPECT_EQ(audio_codec_type("G726"), 20);
  for (const char* codec : {"g711", "none", ""}) EXPECT_EQ(audio_codec_type(codec), -1) << codec;
}

}  // namespace
}  // namespace vexa
