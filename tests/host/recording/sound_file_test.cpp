// SPDX-License-Identifier: Apache-2.0
#include "host/recording/sound_file.h"

#include <gtest/gtest.h>

#include <filesystem>

#include "tests/support/temporary_folder.h"

namespace vexa::host {
namespace {

using vexa_test::contents_of;
using vexa_test::TemporaryFolder;

std::string sound_written(SoundFormat format, const std::string& sound, std::size_t pieces) {
  const TemporaryFolder folder;
  FrameFile file(folder / "sound");
  SoundFile target(file, format);
  for (std::size_t i = 0; i < pieces; ++i) {
    EXPECT_FALSE(target.write(reinterpret_cast<const unsigned char*>(sound.data()), sound.size()));
  }
  EXPECT_EQ(target.bytes(), pieces * sound.size());
  EXPECT_FALSE(target.close());
  return std::filesystem::exists(folder / "sound") ? contents_of(folder / "sound") : "no file";
}

TEST(SoundFile, FormatGoesByTheEndOfTheName) {
  EXPECT_EQ(sound_format_of("a.wav"), SoundFormat::kWave);
  EXPECT_EQ(sound_format_of("a.WAV"), SoundFormat::kWave);
  for (const char* raw : {"a.g711", "wav", "-", ""}) EXPECT_EQ(sound_format_of(raw), SoundFormat::kRaw) << raw;
}

TEST(SoundFile, RawSoundStaysAsItIs) { EXPECT_EQ(sound_written(SoundFormat::kRaw, "abc", 2), "abcabc"); }

TEST(SoundFile, WaveHeaderNamesMuLawAndTheLength) {
  const std::string header =
      std::string("RIFF\x38\0\0\0WAVEfmt \x12\0\0\0\x07\0\x01\0\x40\x1f\0\0\x40\x1f\0\0", 36 - 4) +
      std::string("\x01\0\x08\0\0\0fact\4\0\0\0\6\0\0\0data\6\0\0\0", 26);
  ASSERT_EQ(header.size(), 58U);
  EXPECT_EQ(sound_written(SoundFormat::kWave, "abc", 2), header + "abcabc");
}

TEST(SoundFile, AnOddNumberOfSamplesIsPadded) {
  const std::string file = sound_written(SoundFormat::kWave, "abc", 1);
  ASSERT_EQ(file.size(), 62U);
  EXPECT_EQ(file.substr(4, 4), std::string("\x36\0\0\0", 4));
  EXPECT_EQ(file.substr(54), std::string("\3\0\0\0abc\0", 8));
}

TEST(SoundFile, WithoutSoundThereIsNoFile) {
  EXPECT_EQ(sound_written(SoundFormat::kWave, "", 0), "no file");
  EXPECT_EQ(sound_written(SoundFormat::kRaw, "", 0), "no file");
}

}  // namespace
}  // namespace vexa::host
