// SPDX-License-Identifier: Apache-2.0
// Facts and counts of streams from a whole camera.
#include "vexa/frame_facts.h"

#include <gtest/gtest.h>
#include <netinet/in.h>
#include <sys/socket.h>

#include <chrono>
#include <cstdlib>
#include <functional>
#include <optional>
#include <thread>

#include "tests/media/live_camera.h"
#include "tests/media/statistics_equations.h"
#include "tests/support/descriptors.h"
#include "tests/support/process_state.h"
#include "vexa/reception.h"

namespace vexa_test {
namespace {

using vexa::FrameFacts;

constexpr std::int64_t kSecond = 1'000'000'000;

/// A camera at the pace of life, whose reports come with every fifth picture.
vexa::camera::CameraOptions reporting() {
  auto options = camera_options();
  options.speed = 1;
  options.sender_reports.every = 5;
  return options;
}

class FactsOfALiveStream : public testing::Test {
 protected:
  void start(const vexa::camera::CameraOptions& options) {
    camera_.emplace(options);
    camera_->play(driver_);
  }
  /// Takes frames until one's facts are `wanted`; false after ten seconds.
  bool take_until(const std::function<bool(const FrameFacts&)>& wanted) {
    const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(60);
    while (std::chrono::steady_clock::now() < end) {
      SLibDVideoFrameInfo frame;
      if (vexa::GetCurrentVideoFrame(driver_, frame, facts_) != LIBD_OK) {
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
        continue;
      }
      ++frames_;
      expect_equations(statistics_of(driver_));
      if (wanted(facts_)) return true;
    }
    return false;
  }
  bool take(unsigned frames) {
    return take_until([&](const FrameFacts&) { return frames_ >= frames; });
  }
  bool knows(std::uint32_t bit) const { return (facts_.valid & bit) != 0; }

  std::optional<LiveCamera> camera_;
  MediaDriver driver_;
  FrameFacts facts_;
  unsigned frames_ = 0;
};

TEST_F(FactsOfALiveStream, CountEveryPacketThatTheCameraSent) {
  auto options = reporting();
  options.pictures = 8;
  start(options);
  ASSERT_TRUE(take(8));
  const vexa::StreamStatistics s = statistics_of(driver_);
  EXPECT_TRUE(eventually([&] { return (*camera_)->sent().sent() == s.packetsReceived; }));  // noted after it is sent
  EXPECT_EQ(s.framesHandedOut, 8u);
  EXPECT_EQ(s.packetsMissing, 0u);
  EXPECT_GT(s.httpRequests, 0u);
  EXPECT_EQ(s.rtspRequests, 3u + s.keepAlives) << "DESCRIBE, SETUP and PLAY";
  EXPECT_EQ(driver_.StopVideoStreaming(), LIBD_OK);
  const vexa::StreamStatistics after = statistics_of(driver_);
  expect_equations(after);
  expect_not_fallen(s, after);
  EXPECT_EQ(after.rtspRequests, 4u + after.keepAlives) << "and TEARDOWN";
}

TEST_F(FactsOfALiveStream, SayWhenPacketsCameByTheKernelsClock) {
  start(reporting());
  ASSERT_TRUE(take(3));
  ASSERT_TRUE(knows(vexa::FRAME_FACTS_ARRIVAL));
  EXPECT_EQ(facts_.arrivalSource, vexa::FRAME_ARRIVAL_KERNEL);
  EXPECT_LE(facts_.firstArrivalMonotonicTime, facts_.lastArrivalMonotonicTime);
  const auto now = std::chrono::system_clock::now().time_since_epoch();
  const std::int64_t age = std::chrono::nanoseconds(now).count() - facts_.lastArrivalRealTime;
  EXPECT_LT(std::abs(age), 10 * kSecond);
}

TEST_F(FactsOfALiveStream, HaveTheCamerasTimeAndTheCameraIsReportedTo) {
  start(reporting());
  ASSERT_TRUE(take_until([](const FrameFacts& facts) { return (facts.valid & vexa::FRAME_FACTS_SENDER_TIME) != 0; }));
  EXPECT_EQ(facts_.senderTimeSource, vexa::FRAME_SENDER_TIME_REPORT);
  EXPECT_LT(std::abs(facts_.senderTime - facts_.lastArrivalRealTime), 5 * kSecond);
  EXPECT_LT(facts_.senderTimeUncertainty, 10'000'000u);
  ASSERT_TRUE(knows(vexa::FRAME_FACTS_CAMERA_CLOCK));
  EXPECT_EQ(facts_.cameraClockState, vexa::FRAME_CAMERA_CLOCK_RUNNING);
  EXPECT_TRUE(take_until([this](const FrameFacts&) { return (*camera_)->sent().heard() > 0; }));
  EXPECT_GT(statistics_of(driver_).rtcpReceiverReports, 0u);
  EXPECT_NE(statistics_of(driver_).rtcpPort, 0u);
}

TEST_F(FactsOfALiveStream, RecogniseLocalTimeSentAsUtc) {
  auto options = reporting();
  options.sender_reports.ahead = std::chrono::minutes(345);
  start(options);
  ASSERT_TRUE(take_until([](const FrameFacts& facts) { return (facts.valid & vexa::FRAME_FACTS_CAMERA_CLOCK) != 0; }));
  EXPECT_EQ(facts_.cameraClockState, vexa::FRAME_CAMERA_CLOCK_LOCAL_TIME);
  EXPECT_EQ(facts_.cameraClockLocalTimeMinutes, 345);
}

TEST_F(FactsOfALiveStream, NameAClockThatStands) {
  auto options = reporting();
  options.sender_reports.clock = vexa::camera::ReportedClock::kFrozen;
  start(options);
  EXPECT_TRUE(
      take_until([](const FrameFacts& facts) { return facts.cameraClockState == vexa::FRAME_CAMERA_CLOCK_FROZEN; }));
  EXPECT_FALSE(knows(vexa::FRAME_FACTS_SENDER_TIME));
}

TEST_F(FactsOfALiveStream, CountAStepOfTheClock) {
  auto options = reporting();
  options.sender_reports.step_at = 15;
  options.sender_reports.step = std::chrono::seconds(3600);
  start(options);
  EXPECT_TRUE(take_until([](const FrameFacts& facts) { return facts.cameraClockSteps == 1; }));
}

TEST_F(FactsOfALiveStream, HaveNoTimeOfACameraWithoutAClockOrOfAnotherSource) {
  for (const bool other : {false, true}) {
    auto options = reporting();
    options.sender_reports.other_ssrc = other;
    if (!other) options.sender_reports.clock = vexa::camera::ReportedClock::kZero;
    start(options);
    const auto seen = [this, other](const FrameFacts&) {
      const vexa::StreamStatistics s = statistics_of(driver_);
      return (other ? s.rtcpRefused : s.rtcpSenderReports) > 0;
    };
    EXPECT_TRUE(take_until(seen));
    EXPECT_FALSE(knows(vexa::FRAME_FACTS_SENDER_TIME));
    EXPECT_EQ(driver_.StopVideoStreaming(), LIBD_OK);
    camera_.reset();
  }
}

TEST_F(FactsOfALiveStream, AreThoseOfTheSlotsFrames) {
  auto options = reporting();
  options.packet_faults.sequence_restarts = {{.picture = 10, .value = 40000}};
  start(options);
  ASSERT_TRUE(take(1));
  EXPECT_EQ(facts_.discontinuity, vexa::FRAME_DISCONTINUITY_START);
  EXPECT_TRUE(take_until(
      [](const FrameFacts& facts) { return facts.discontinuity == vexa::FRAME_DISCONTINUITY_SEQUENCE_RESTART; }));
}

TEST_F(FactsOfALiveStream, ComeFromTheCameraAloneWithStrictReception) {
  vexa::SetStrictReception(driver_, true);
  start(reporting());
  ASSERT_TRUE(take(3));
  EXPECT_EQ(statistics_of(driver_).packetsDiscardedForeignSource, 0u);
  // A stranger's datagrams, from this machine's usual address.
  const int port = port_of(driver_.state().stream_socket());
  ASSERT_NE(port, 0);
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_port = htons(static_cast<std::uint16_t>(port));
  address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  vexa::Socket stranger(socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0));
  for (int i = 0; i < 100; ++i) {
    unsigned char datagram[20] = {0x80, 96, 1, static_cast<unsigned char>(i)};
    ASSERT_EQ(
        sendto(stranger.get(), datagram, sizeof datagram, 0, reinterpret_cast<sockaddr*>(&address), sizeof address),
        20);
  }
  EXPECT_TRUE(
      take_until([this](const FrameFacts&) { return statistics_of(driver_).packetsDiscardedForeignSource == 100; }));
}

TEST_F(FactsOfALiveStream, NameTheControlPortBesideTheMediaPort) {
  start(reporting());
  ASSERT_TRUE(take(1));
  const int port = port_of(driver_.state().stream_socket());
  ASSERT_NE(port, 0);
  EXPECT_EQ(statistics_of(driver_).rtcpPort, static_cast<unsigned>(port) + 1);
}

}  // namespace
}  // namespace vexa_test
