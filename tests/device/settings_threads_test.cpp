// SPDX-License-Identifier: Apache-2.0
// Host threads that read and set while video streams.
#include <gtest/gtest.h>

#include <atomic>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include "tests/device/camera_info_fields.h"
#include "tests/media/live_camera.h"

namespace vexa_test {
namespace {

constexpr std::size_t kPictures = 100;

/// A record that a host sets; the stream needs its codec.
SLibDCameraInfo set_record(int mark) {
  SLibDCameraInfo info = marked_camera_info(mark);
  info.codecName = "H.264";
  return info;
}

/// The same as it is handed out by a camera that names no codec.
SLibDCameraInfo read_record(int mark) {
  SLibDCameraInfo info = set_record(mark);
  info.codecType = 0;
  return info;
}

/// A driver whose fixed video information a model class has filled.
using ModelDriver = MediaDriver;

class SettingsThreads : public testing::Test {
 protected:
  SettingsThreads() : camera_(camera_options()) {
    camera_->settings().set_answer("camera", "A=1&XDNR=low&ViewDR=on");
    camera_.introduce(driver_, 20000);
    driver_.m_FixedSystemInfo.modelName = "LMX-P100";
  }

  /// Streams; meanwhile each of the jobs is done again and again on a thread of its own.
  template <typename... Jobs>
  void stream_while(Jobs... jobs) {
    ASSERT_EQ(driver_.StartVideoStreaming(), LIBD_OK);
    std::atomic<bool> over{false};
    std::vector<std::thread> hosts;
    (hosts.emplace_back([&over, jobs] {
      while (!over) jobs();
    }),
     ...);
    const auto frames = FrameTaker().take_all(driver_, kPictures);
    over = true;
    for (std::thread& host : hosts) host.join();
    EXPECT_EQ(frames.size(), kPictures);
    EXPECT_EQ(driver_.StopVideoStreaming(), LIBD_OK);
  }

  LiveCamera camera_;
  ModelDriver driver_;
};

TEST_F(SettingsThreads, SeeNoTornRecordOfVideoSettings) {
  SLibDCameraInfo first = set_record(1);
  ASSERT_EQ(driver_.SetCameraInfo(first), LIBD_OK);
  const auto set_and_read = [this](int mark) {
    SLibDCameraInfo info = set_record(mark);
    ASSERT_EQ(driver_.SetCameraInfo(info), LIBD_OK);
    ASSERT_EQ(driver_.GetCameraInfo(info), LIBD_OK);
    info.rtspPort = read_record(1).rtspPort;  // starting a stream puts the port where streams are
    SLibDCameraInfo one = read_record(1);
    SLibDCameraInfo two = read_record(2);
    two.rtspPort = one.rtspPort;
    ASSERT_TRUE(info == one || info == two) << testing::PrintToString(info);
  };
  stream_while([=] { set_and_read(1); }, [=] { set_and_read(2); });
}

TEST_F(SettingsThreads, SeeNoTornListOfCodecs) {
  driver_.m_FixedCameraInfoAvailable = true;
  ASSERT_EQ(driver_.SetSolidPTZState(false), LIBD_OK);
  const std::set<std::size_t> whole = {9, 6, 2};  // sizes without a criterion, and under each of the two
  stream_while(
      [this] {
        driver_.SetSolidPTZState(true);
        driver_.SetImageMaxSize(320, 240, LIBD_VIDEO_PAL);
      },
      [this, &whole] {
        SLibDFixedCameraInfo info;
        ASSERT_EQ(driver_.GetFixedCameraInfo(info), LIBD_OK);
        ASSERT_EQ(info.codecs.size(), 2u);
        ASSERT_EQ(whole.count(info.codecs[0].resolutions.size()), 1u);
        ASSERT_EQ(info.codecs[0].resolutions.size(), info.codecs[1].resolutions.size());
      });
}

TEST_F(SettingsThreads, ReadAndSetImageControls) {
  stream_while(
      [this] {
        ASSERT_EQ(driver_.SetXdnrMode(LIBD_XDNR_LOW), LIBD_OK);
        ELibDXdnrType noise = LIBD_XDNR_HIGH;
        ASSERT_EQ(driver_.GetXdnrMode(noise), LIBD_OK);
        ASSERT_EQ(noise, LIBD_XDNR_LOW);
      },
      [this] {
        SLibDCameraInfo info;
        info.codecName = "H.264";
        ASSERT_EQ(driver_.GetCameraInfo(info), LIBD_OK);
        ELibDViewDRMode range = LIBD_VIEWDR_OFF;
        ASSERT_EQ(driver_.GetViewDR(range), LIBD_OK);
        ASSERT_EQ(range, LIBD_VIEWDR_ON);
      });
}

}  // namespace
}  // namespace vexa_test
