// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/source/live_video.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstdint>
#include <future>
#include <memory>
#include <stdexcept>
#include <string>
#include <utility>
#include <variant>

#include "tests/support/decoder.h"
#include "tests/support/temporary_folder.h"

namespace vexa::camera {
namespace {

constexpr auto kLongestWait = std::chrono::seconds(20);

/// One grey from edge to edge, another one each time.
void paint_grey(std::chrono::steady_clock::time_point, I420Picture& picture) {
  static std::atomic<int> turn{0};
  const auto pixels = static_cast<std::size_t>(picture.width()) * static_cast<std::size_t>(picture.height());
  std::fill_n(picture.y(), pixels, static_cast<std::uint8_t>(40 + turn++ % 150));
  std::fill_n(picture.u(), pixels / 2, std::uint8_t{128});
}

SourcePicture next_picture(PictureSource& source) {
  for (;;) {
    if (auto picture = source.next()) return *picture;
    const auto came = std::make_shared<std::promise<void>>();
    source.wait([came] { came->set_value(); });
    if (came->get_future().wait_for(kLongestWait) != std::future_status::ready) throw std::runtime_error("no picture");
  }
}

class LiveVideoTest : public testing::TestWithParam<Codec> {
 protected:
  void SetUp() override {
    if (!has_live_encoders()) GTEST_SKIP() << "this build has no encoders";
    LiveEncoding encoding;
    encoding.codec = GetParam();
    encoding.width = 160;
    encoding.height = 128;
    encoding.frame_rate = 10;
    encoding.key_interval = 1000;
    auto opened = LiveVideo::open(encoding, 20, paint_grey);
    ASSERT_TRUE(std::holds_alternative<std::shared_ptr<LiveVideo>>(opened));
    video_ = std::get<std::shared_ptr<LiveVideo>>(opened);
  }
  std::shared_ptr<LiveVideo> video_;
};

TEST_P(LiveVideoTest, EachWhoWatchesBeginsWithAKeyPictureAndADecoderFindsThemAll) {
  const auto first = video_->watch();
  EXPECT_FALSE(first->ended());
  EXPECT_EQ(first->format().frames_per_second, 10);
  std::string bytes;
  std::string later_bytes;
  std::unique_ptr<PictureSource> later;
  for (std::size_t i = 0; i < 12; ++i) {
    if (i == 4) later = video_->watch();
    const SourcePicture picture = next_picture(*first);
    EXPECT_EQ(picture.key, is_key_picture(picture.codec, *picture.bytes));
    EXPECT_EQ(picture.place, i);
    EXPECT_EQ(picture.due.count() % 100000000, 0) << "a time of the rate";
    if (i == 0) {
      EXPECT_TRUE(picture.key);
      EXPECT_EQ(picture.due.count(), 0);
    }
    bytes += *picture.bytes;
    if (!later) continue;
    const SourcePicture same = next_picture(*later);
    if (later_bytes.empty()) {
      EXPECT_TRUE(same.key);
      EXPECT_EQ(same.due.count(), 0);
    }
    later_bytes += *same.bytes;
  }
  const vexa_test::TemporaryFolder folder(vexa_test::memory_folder());
  const char* format = GetParam() == Codec::kJpeg ? "mjpeg" : GetParam() == Codec::kMpeg4 ? "m4v" : "h264";
  const auto all = vexa_test::decode(folder.make_file("all", bytes), format);
  EXPECT_TRUE(all.flawless);
  EXPECT_EQ(all.frames, 12U);
  EXPECT_EQ(all.size, "160x128");
  const auto rest = vexa_test::decode(folder.make_file("later", later_bytes), format);
  EXPECT_TRUE(rest.flawless);
  EXPECT_EQ(rest.frames, 8U);
}

TEST_P(LiveVideoTest, EndsWithTheLastWhoWatches) {
  auto first = video_->watch();
  auto second = video_->watch();
  const std::weak_ptr<LiveVideo> video = std::exchange(video_, nullptr);
  (void)next_picture(*first);
  first.reset();
  (void)next_picture(*second);
  EXPECT_FALSE(video.expired());
  second.reset();
  EXPECT_TRUE(video.expired());
}

INSTANTIATE_TEST_SUITE_P(Of, LiveVideoTest, testing::Values(Codec::kJpeg, Codec::kMpeg4, Codec::kH264));

TEST(LiveVideo, ReportsWhyThereIsNone) {
  LiveEncoding encoding;
  encoding.width = 161;
  encoding.height = 128;
  const auto opened = LiveVideo::open(encoding, 1, paint_grey);
  ASSERT_TRUE(std::holds_alternative<std::string>(opened));
  EXPECT_FALSE(std::get<std::string>(opened).empty());
}

}  // namespace
}  // namespace vexa::camera
