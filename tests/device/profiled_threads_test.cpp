// Host threads that read and set a camera of a profile while its video streams, through the host's interface alone.
#include <gtest/gtest.h>

#include <atomic>
#include <string>
#include <thread>
#include <vector>

#include "tests/media/media_driver.h"
#include "tests/media/pace.h"
#include "tests/support/model_camera.h"

namespace vexa_test {
namespace {

constexpr std::size_t kPictures = 60;
constexpr int kSideStream = 2;  // the one that is set; the first one streams

/// One of two records that differ in every field that is set.
SLibDCameraInfo side_record(int mark) {
  SLibDCameraInfo info;
  info.codecName = "H.264";
  info.streamNumber = kSideStream;
  info.imageWidth = mark == 1 ? 640 : 320;
  info.imageHeight = mark == 1 ? 368 : 192;
  info.imageSizeText = mark == 1 ? "640x368" : "320x192";
  info.frameRate = mark == 1 ? 10 : 25;
  info.frameRateText = mark == 1 ? "10fps" : "25fps";
  info.bitRate = mark == 1 ? 512 : 1024;
  info.bitRateText = mark == 1 ? "512kbit/s" : "1024kbit/s";
  info.reserved7 = mark;
  info.reserved14 = std::string(300, static_cast<char>('0' + mark));
  info.reserved15 = mark;
  info.rotation = mark == 1 ? 180 : 90;
  info.reserved19 = mark;
  return info;
}

/// Which record the camera's answer was, by the fields that it tells; 0 for a mixture.
int told_mark(const SLibDCameraInfo& info) {
  for (const int mark : {1, 2}) {
    const SLibDCameraInfo whole = side_record(mark);
    const bool size = info.imageWidth == whole.imageWidth && info.imageHeight == whole.imageHeight &&
                      info.imageSizeText == whole.imageSizeText;
    const bool rate = info.frameRate == whole.frameRate && info.frameRateText == whole.frameRateText;
    const bool bits = info.bitRate == whole.bitRate && info.bitRateText == whole.bitRateText;
    if (size && rate && bits) return mark;
  }
  return 0;
}

/// Which record the host stored last, by the fields that no camera tells; 0 for a mixture.
int stored_mark(const SLibDCameraInfo& info) {
  for (const int mark : {1, 2}) {
    const SLibDCameraInfo whole = side_record(mark);
    const bool numbers = info.reserved7 == whole.reserved7 && info.reserved15 == whole.reserved15 &&
                         info.rotation == whole.rotation && info.reserved19 == whole.reserved19;
    if (numbers && info.reserved14 == whole.reserved14) return mark;
  }
  return 0;
}

class ProfiledThreads : public testing::TestWithParam<const char*>, protected ModelCamera {
 protected:
  void start(const std::string& model) {
    vexa::camera::CameraOptions options;
    options.speed = kPace;
    ASSERT_NO_FATAL_FAILURE(start_model(model, options));
    SLibDCameraInfo first;
    ASSERT_EQ(device_->GetCameraInfo(first), LIBD_OK);
    ASSERT_EQ(first.codecName, "H.264");
    ASSERT_EQ(device_->StartVideoStreaming(), LIBD_OK);
    SLibDCameraInfo side = side_record(1);
    ASSERT_EQ(device_->SetCameraInfo(side), LIBD_OK);
  }

  void set_and_read(int mark) {
    SLibDCameraInfo info = side_record(mark);
    ASSERT_EQ(device_->SetCameraInfo(info), LIBD_OK);
    ASSERT_EQ(device_->GetCameraInfo(info), LIBD_OK);
    ASSERT_NE(told_mark(info), 0) << info.imageSizeText << " " << info.frameRateText << " " << info.bitRateText;
    ASSERT_NE(stored_mark(info), 0) << info.reserved7 << info.reserved14[0] << info.reserved15 << info.reserved19;
  }

  void control_image(ELibDDayNightType wanted) {
    ASSERT_EQ(device_->SetDayNightMode(wanted), LIBD_OK);
    ELibDDayNightType mode = LIBD_DAYNIGHT_UNKNOWN;
    ASSERT_EQ(device_->GetDayNightMode(mode), LIBD_OK);
    ASSERT_TRUE(mode == LIBD_DAYNIGHT_AUTO || mode == LIBD_DAYNIGHT_NIGHT) << mode;
    ASSERT_EQ(device_->SetXdnrMode(LIBD_XDNR_LOW), LIBD_OK);
  }

  void shape_offer() {
    ASSERT_EQ(device_->SetSolidPTZState(true), LIBD_OK);
    SLibDFixedCameraInfo offer;
    ASSERT_EQ(device_->GetFixedCameraInfo(offer), LIBD_OK);
    ASSERT_FALSE(offer.codecs.empty());
    for (const SLibDVideoCodecInfo& codec : offer.codecs) ASSERT_FALSE(codec.resolutions.empty()) << codec.name;
    ASSERT_EQ(device_->SetSolidPTZState(false), LIBD_OK);
  }

  void act(int mark) {
    set_and_read(mark);
    control_image(mark == 1 ? LIBD_DAYNIGHT_AUTO : LIBD_DAYNIGHT_NIGHT);
    shape_offer();
  }
};

TEST_P(ProfiledThreads, SeeWholeRecordsWhileVideoStreams) {
  ASSERT_NO_FATAL_FAILURE(start(GetParam()));
  std::atomic<bool> over{false};
  std::atomic<int> rounds{0};
  std::vector<std::thread> hosts;
  for (const int mark : {1, 2}) {
    hosts.emplace_back([&, mark] {
      for (; !over && !HasFatalFailure(); ++rounds) act(mark);
    });
  }
  const auto frames = FrameTaker().take_all(*device_, kPictures);
  over = true;
  for (std::thread& host : hosts) host.join();
  EXPECT_EQ(frames.size(), kPictures);
  EXPECT_GT(rounds, 1);
  EXPECT_EQ(device_->StopVideoStreaming(), LIBD_OK);
}

INSTANTIATE_TEST_SUITE_P(Models, ProfiledThreads, testing::Values("LMX-H100", "LMX-P100"));

}  // namespace
}  // namespace vexa_test
