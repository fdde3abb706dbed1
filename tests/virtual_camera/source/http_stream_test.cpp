// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/source/http_stream.h"

#include <gtest/gtest.h>

namespace vexa::camera {
namespace {

using Action = HttpStreamFault::Action;

std::shared_ptr<const ImageClip> clip(Codec kind) {
  return std::make_shared<const ImageClip>(kind, std::vector<std::string>{"one", "two", "three"});
}

/// What leaves, up to `most` pieces, joined by "|".
std::string sent(HttpStream& stream, int most = 100) {
  std::string text;
  for (int i = 0; i < most; ++i) {
    const auto piece = stream.next();
    if (!piece) break;
    text += (text.empty() ? "" : "|") + piece->bytes;
  }
  return text;
}

std::string elementary(HttpStreamOptions options) {
  options.loop = false;
  HttpStream stream(clip(Codec::kH264), std::move(options));
  const std::string text = sent(stream);
  return text + (stream.closes() ? "" : "|silent");
}

HttpStreamOptions with_fault(Action action, const std::string& text = "", std::size_t bytes = 0) {
  HttpStreamOptions options;
  options.faults.push_back({1, action, text, bytes, std::chrono::milliseconds(0)});
  return options;
}

std::string part(const std::string& lines, const std::string& picture) {
  return "--picture\r\nContent-Type: image/jpeg\r\n" + lines + "\r\n" + picture + "\r\n";
}

TEST(HttpStream, PutsEachJpegPictureIntoAPartOfItsOwn) {
  HttpStream stream(clip(Codec::kJpeg), {});
  EXPECT_NE(stream.head().find("multipart/x-mixed-replace"), std::string::npos);
  EXPECT_EQ(sent(stream, 2), part("DataLen: 3\r\n", "one") + "|" + part("DataLen: 3\r\n", "two"));
}

TEST(HttpStream, SendsElementaryStreamsAsTheyAre) {
  EXPECT_EQ(elementary({}), "one|two|three");
  EXPECT_EQ(HttpStream(clip(Codec::kMpeg4), {}).head().find("multipart"), std::string::npos);
}

TEST(HttpStream, StartsOverUnlessItIsToldToEnd) {
  HttpStream stream(clip(Codec::kH264), {});
  EXPECT_EQ(sent(stream, 4), "one|two|three|one");
  HttpStreamOptions four;
  four.units = 4;
  HttpStream ending(clip(Codec::kH264), four);
  EXPECT_EQ(sent(ending), "one|two|three|one");
}

TEST(HttpStream, GivesEachUnitItsTime) {
  HttpStreamOptions options;
  options.units_per_second = 10;
  options.piece = 2;
  options.faults.push_back({2, Action::kPause, "", 0, std::chrono::milliseconds(50)});
  HttpStream stream(clip(Codec::kH264), options);
  const int due[] = {0, 0, 100, 100, 250, 250, 250, 350};
  for (const int after : due) EXPECT_EQ(stream.next()->due, std::chrono::milliseconds(after));
}

TEST(HttpStream, LeavesInPiecesOfAnyLength) {
  HttpStreamOptions options;
  options.piece = 2;
  EXPECT_EQ(elementary(options), "on|e|tw|o|th|re|e");
}

TEST(HttpStream, CutsUnitsOfSound) {
  HttpStreamOptions once;
  once.loop = false;
  HttpStream sound("0123456789", 4, once);
  EXPECT_EQ(sent(sound), "0123|4567");
}

TEST(HttpStream, ShowsEachFaultAtItsUnit) {
  EXPECT_EQ(elementary(with_fault(Action::kBefore, "garbage ")), "one|garbage two|three");
  EXPECT_EQ(elementary(with_fault(Action::kCut, "", 1)), "one|t|three");
  EXPECT_EQ(elementary(with_fault(Action::kCut, "", 0)), "one|three");
  EXPECT_EQ(elementary(with_fault(Action::kClose, "", 1)), "one|t");
  EXPECT_EQ(elementary(with_fault(Action::kSilence, "", 1)), "one|t|silent");
  EXPECT_EQ(elementary(with_fault(Action::kSilence, "", 0)), "one|silent");
  EXPECT_EQ(elementary(with_fault(Action::kOtherClip, "missing.h264")), "one");
}

TEST(HttpStream, LiesAboutTheLengthOfAPart) {
  HttpStream lie(clip(Codec::kJpeg), with_fault(Action::kDataLength, "-7"));
  sent(lie, 1);
  EXPECT_EQ(sent(lie, 1), part("DataLen: -7\r\n", "two"));
  HttpStream none(clip(Codec::kJpeg), with_fault(Action::kNoDataLength));
  sent(none, 1);
  EXPECT_EQ(sent(none, 1), part("", "two"));
}

TEST(HttpStream, OfAnotherClipBeginsWithItsFirstPicture) {
  const auto other = ImageClip::load(VEXA_CLIPS "/small.m4v");
  HttpStream stream(clip(Codec::kH264), with_fault(Action::kOtherClip, VEXA_CLIPS "/small.m4v"));
  EXPECT_EQ(sent(stream, 3), "one|" + other->pictures()[0] + "|" + other->pictures()[1]);
}

TEST(SoundRate, IsTheBytesASecondOfACodec) {
  EXPECT_EQ(sound_rate("g711_64"), 8000U);
  EXPECT_EQ(sound_rate("g726_40"), 5000U);
  EXPECT_EQ(sound_rate("g726_32"), 4000U);
  EXPECT_EQ(sound_rate("g726_24"), 3000U);
  EXPECT_EQ(sound_rate("g726_16"), 2000U);
  EXPECT_EQ(sound_rate("g711"), 0U);
}

}  // namespace
}  // namespace vexa::camera
