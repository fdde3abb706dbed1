// SPDX-License-Identifier: Apache-2.0
#include "host/serve/video_feed.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace vexa::host {
namespace {

using namespace std::string_literals;

// Main profile, 320x240: see the tests of H264Units for its fields.
const std::string kSps = "\x67\x4d\x40\x1f\xda\x05\x07\xe4"s;
const std::string kOtherSps = "\x67\x42\xc0\x1e\xda\x05\x07\xe4"s;
const std::string kPps = "\x68\xee\x3c\x80"s;
const std::string kStart = "\0\0\0\1"s;

std::string key_picture(const std::string& sps, std::size_t size = 8) {
  return kStart + sps + kStart + kPps + kStart + "\x65" + std::string(size, 'k');
}
std::string other_picture(std::size_t size = 8) { return kStart + "\x41" + std::string(size, 'o'); }

class Feed : public testing::Test {
 protected:
  // A picture that comes `step` milliseconds after the one before.
  void take(const std::string& picture, bool is_key, std::int64_t step = 40, bool is_first = false) {
    now_ += step;
    SessionFrame frame;
    frame.data = reinterpret_cast<const unsigned char*>(picture.data());
    frame.length = picture.size();
    frame.arrival = now_;
    if (has_time_) {
      frame.seconds = static_cast<std::int32_t>(now_ / 1000);
      frame.microseconds = static_cast<std::int32_t>(now_ % 1000 * 1000);
    }
    frame.isKey = is_key;
    frame.isFirst = is_first;
    feed_.take(frame);
  }
  std::vector<VideoFeed::Piece> rest(VideoFeed::Place& place) const {
    std::vector<VideoFeed::Piece> pieces;
    while (auto piece = feed_.next(place)) pieces.push_back(*piece);
    return pieces;
  }
  static std::uint32_t number_at(const std::string& bytes, std::size_t at) {
    std::uint32_t value = 0;
    for (std::size_t i = 0; i < 4; ++i) value = value << 8U | static_cast<unsigned char>(bytes.at(at + i));
    return value;
  }
  static std::uint32_t time_of(const VideoFeed::Piece& piece) {
    return number_at(*piece.bytes, piece.bytes->find("tfdt") + 12);
  }
  static std::uint32_t duration_of(const VideoFeed::Piece& piece) {
    return number_at(*piece.bytes, piece.bytes->find("trun") + 16);
  }

  VideoFeed feed_;
  std::int64_t now_ = 1000000;
  bool has_time_ = true;
};

TEST_F(Feed, WhoComesLaterBeginsWithTheLatestKeyPicture) {
  VideoFeed::Place place;
  for (int i = 0; i < 3; ++i) take(key_picture(kSps, 4U + static_cast<unsigned>(i)), true);
  const auto pieces = rest(place);
  ASSERT_EQ(pieces.size(), 2U);
  EXPECT_NE(pieces[1].bytes->find("\x65kkkkk"), std::string::npos);
  EXPECT_EQ(place.missed, 0U);
}

TEST_F(Feed, BeginsWithAnInitialisationSegmentAndAKeyPicture) {
  VideoFeed::Place place;
  take(other_picture(), false);
  take(key_picture(kSps), true);
  EXPECT_TRUE(rest(place).empty());  // how long it is shown is not known yet
  take(other_picture(), false);
  const auto pieces = rest(place);
  ASSERT_EQ(pieces.size(), 2U);
  EXPECT_EQ(pieces[0].codec, "avc1.4D401F");
  EXPECT_EQ(pieces[0].bytes->substr(4, 4), "ftyp");
  EXPECT_NE(pieces[0].bytes->find("avcC\x01\x4d\x40\x1f"), std::string::npos);
  EXPECT_EQ(pieces[1].codec, "");
  EXPECT_EQ(pieces[1].bytes->substr(4, 4), "moof");
  EXPECT_NE(pieces[1].bytes->find("mdat\0\0\0\x9\x65kkkkkkkk"s), std::string::npos);
  EXPECT_EQ(duration_of(pieces[1]), 3600U);  // 40 ms
}

TEST_F(Feed, ItsTimeLineIsWithoutGapsWhateverTheCamerasTimesAre) {
  VideoFeed::Place place;
  take(key_picture(kSps), true);
  for (const std::int64_t step : {40, 20, 0, 1000, 60000, -5000, 40}) take(other_picture(), false, step);
  const auto pieces = rest(place);
  ASSERT_EQ(pieces.size(), 8U);
  std::uint32_t expected = 0;
  for (std::size_t i = 1; i < pieces.size(); ++i) {
    EXPECT_EQ(time_of(pieces[i]), expected) << i;
    expected += duration_of(pieces[i]);
  }
  const std::vector<std::uint32_t> durations = {3600, 1800, 90, 90000, 90000, 90, 3600};
  for (std::size_t i = 0; i < durations.size(); ++i) EXPECT_EQ(duration_of(pieces[i + 1]), durations[i]) << i;
}

TEST_F(Feed, PicturesWithoutTimesAreShownAsTheyArrive) {
  has_time_ = false;
  VideoFeed::Place place;
  take(key_picture(kSps), true);
  take(other_picture(), false, 100);
  EXPECT_EQ(duration_of(rest(place).at(1)), 9000U);
}

TEST_F(Feed, AnotherParameterSetIsAnotherInitialisationSegment) {
  VideoFeed::Place place;
  take(key_picture(kSps), true);
  take(key_picture(kSps), true);
  const auto former = rest(place);
  ASSERT_EQ(former.size(), 2U);
  EXPECT_EQ(former[0].codec, "avc1.4D401F");
  take(key_picture(kOtherSps), true);
  take(other_picture(), false);
  const auto pieces = rest(place);
  ASSERT_EQ(pieces.size(), 3U);
  EXPECT_EQ(pieces[0].codec, "");
  EXPECT_EQ(pieces[1].codec, "avc1.42C01E");
}

TEST_F(Feed, AfterAnOutageItGoesOnWithAKeyPicture) {
  VideoFeed::Place place;
  take(key_picture(kSps), true);
  take(other_picture(), false);
  EXPECT_EQ(rest(place).size(), 2U);
  take(other_picture(), false, 5000, true);  // of a new connection
  take(other_picture(), false);
  take(key_picture(kSps), true);
  take(other_picture(), false);
  const auto pieces = rest(place);
  ASSERT_EQ(pieces.size(), 2U);
  EXPECT_NE(pieces[1].bytes->find("\x65kkkkkkkk"), std::string::npos);
  EXPECT_EQ(time_of(pieces[1]), time_of(pieces[0]) + duration_of(pieces[0]));
}

TEST_F(Feed, ASlowViewerLosesWholeGroups) {
  VideoFeed::Place slow;
  take(key_picture(kSps), true);
  take(other_picture(), false);
  EXPECT_EQ(rest(slow).size(), 2U);
  for (int i = 0; i < 20; ++i) take(other_picture(100000), false);
  take(key_picture(kSps, 100), true);
  take(other_picture(), false);
  const auto pieces = rest(slow);
  ASSERT_EQ(pieces.size(), 1U);
  EXPECT_NE(pieces[0].bytes->find("\x65kkkk"), std::string::npos);
  EXPECT_EQ(slow.missed, 21U);
}

TEST_F(Feed, KeepsBoundedBytesAndWaitsForTheNextKeyPicture) {
  VideoFeed::Place late;
  VideoFeed::Place slow;
  take(key_picture(kSps), true);
  take(other_picture(), false);
  EXPECT_EQ(rest(slow).size(), 2U);
  for (int i = 0; i < 100; ++i) take(other_picture(100000), false);
  EXPECT_TRUE(rest(late).empty());
  EXPECT_TRUE(rest(slow).empty());
  take(key_picture(kSps), true);
  take(other_picture(), false);
  EXPECT_EQ(rest(late).size(), 2U);
  EXPECT_EQ(rest(slow).size(), 1U);
}

TEST_F(Feed, AfterClearingOldPicturesAreNotShown) {
  VideoFeed::Place place;
  take(key_picture(kSps), true);
  take(other_picture(), false);
  feed_.clear();
  EXPECT_TRUE(rest(place).empty());
  take(other_picture(), false);
  EXPECT_TRUE(rest(place).empty());
  take(key_picture(kSps), true);
  take(other_picture(), false);
  EXPECT_EQ(rest(place).size(), 2U);
}

TEST_F(Feed, WithoutUsableParameterSetsNothingIsShown) {
  VideoFeed::Place place;
  take(key_picture("\x67\x4d"), true);
  take(kStart + "\x65kkk", true);
  take("", true);
  take("no start code", true);
  take(other_picture(), false);
  EXPECT_TRUE(rest(place).empty());
}

}  // namespace
}  // namespace vexa::host
