#include "transport/wire/sender_clock.h"

#include <gtest/gtest.h>

#include <cstdlib>

namespace vexa {
namespace {

constexpr std::int64_t kSecond = 1'000'000'000;
constexpr std::int64_t kMillisecond = 1'000'000;
constexpr int kRate = 90000;
constexpr std::int64_t kHostStart = 1'800'000'000 * kSecond;  // 2027
constexpr std::int64_t kMonotonicStart = 5'000 * kSecond;

std::uint64_t ntp_of(std::int64_t time) {
  const auto seconds = static_cast<std::uint64_t>(time / kSecond + 2208988800);
  const auto fraction = (static_cast<std::uint64_t>(time % kSecond) << 32) / static_cast<std::uint64_t>(kSecond);
  return (seconds & 0xffffffff) << 32 | fraction;
}

/// A camera that reports, and a clock that follows it.
class Camera {
 public:
  explicit Camera(std::int64_t ahead = 0) : ahead_(ahead) {}

  /// Time passes on the host; the camera's clock runs faster by `parts` of 10^9.
  void pass(std::int64_t time, std::int64_t parts = 0) {
    host_ += time;
    ahead_ += time / 1000 * parts / 1'000'000;
  }
  void step(std::int64_t by) { ahead_ += by; }

  SenderReport report_now() const {
    SenderReport report;
    report.ssrc = 7;
    report.ntp = ntp_of(kHostStart + host_ + ahead_);
    report.rtp_time = rtp_now();
    return report;
  }
  std::uint32_t rtp_now() const { return static_cast<std::uint32_t>(1'000'000 + host_ / 1000 * 9 / 100); }
  SenderClock::Arrival now() const { return {kHostStart + host_, kMonotonicStart + host_}; }
  void report(std::int64_t delay = 0) {
    const auto [real, monotonic] = now();
    clock.report(report_now(), {real + delay, monotonic + delay}, kRate);
  }

  SenderClock clock;

 private:
  std::int64_t host_ = 0;
  std::int64_t ahead_;
};

void expect_near(std::int64_t got, std::int64_t wanted, std::int64_t tolerance) {
  EXPECT_LE(std::abs(got - wanted), tolerance) << got << " is not " << wanted;
}

TEST(SenderClock, KnowsNothingBeforeAReport) {
  const SenderClock clock;
  EXPECT_EQ(clock.state(), SenderClock::State::kUnknown);
  EXPECT_FALSE(clock.time_of(1, kRate));
  EXPECT_FALSE(clock.offset({0, 0}));
  EXPECT_FALSE(clock.rate());
}

TEST(SenderClock, GivesTheTimeOfPicturesBeforeAndAfterAReport) {
  Camera camera(3 * kSecond);
  camera.pass(10 * kSecond);
  camera.report();
  const std::uint32_t rtp = camera.rtp_now();
  const std::int64_t at_report = kHostStart + 13 * kSecond;
  const auto after = camera.clock.time_of(rtp + 3600, kRate);
  const auto before = camera.clock.time_of(rtp - 3600, kRate);
  ASSERT_TRUE(after && before);
  expect_near(after->time, at_report + 40 * kMillisecond, 10);
  expect_near(before->time, at_report - 40 * kMillisecond, 10);
  EXPECT_LT(after->uncertainty, 100'000u);
  EXPECT_LT(after->uncertainty, camera.clock.time_of(rtp + 36000, kRate)->uncertainty);
}

TEST(SenderClock, TheOffsetIsThatOfTheReportDelayedLeast) {
  Camera camera(2 * kSecond);
  for (const std::int64_t delay : {30, 4, 80, 2, 50}) {
    camera.report(delay * kMillisecond);
    camera.pass(5 * kSecond);
  }
  expect_near(*camera.clock.offset(camera.now()), 2 * kSecond - 2 * kMillisecond, 1000);
}

TEST(SenderClock, AnOffsetFollowsAHostWhoseClockIsSet) {
  Camera camera;
  camera.report();
  const auto [real, monotonic] = camera.now();
  expect_near(*camera.clock.offset({real + 60 * kSecond, monotonic}), -60 * kSecond, 1000);
}

TEST(SenderClock, ANtpTimeOf0IsNoClock) {
  Camera camera;
  SenderReport report = camera.report_now();
  report.ntp = 0;
  camera.clock.report(report, camera.now(), kRate);
  EXPECT_EQ(camera.clock.state(), SenderClock::State::kUnknown);
}

TEST(SenderClock, AClockThatBeganIn1970IsReportedAsItIs) {
  Camera camera(-kHostStart);
  camera.report();
  expect_near(*camera.clock.offset(camera.now()), -kHostStart, 1000);
  expect_near(camera.clock.time_of(camera.rtp_now(), kRate)->time, 0, 1000);
}

TEST(SenderClock, AClockOf2036CountsOnInTheNextEra) {
  constexpr std::int64_t kEnd = (std::int64_t{1} << 32) - 2208988800;  // of the era, since 1970
  Camera camera(kEnd * kSecond - kHostStart - kSecond);
  camera.report();
  camera.pass(5 * kSecond);
  camera.report();
  EXPECT_EQ(camera.clock.steps(), 0u);
  expect_near(camera.clock.time_of(camera.rtp_now(), kRate)->time, (kEnd + 4) * kSecond, 1000);
}

TEST(SenderClock, AClockThatStandsGivesNoTime) {
  Camera camera;
  camera.report();
  SenderReport frozen = camera.report_now();
  camera.pass(5 * kSecond);
  frozen.rtp_time = camera.rtp_now();
  camera.clock.report(frozen, camera.now(), kRate);
  EXPECT_EQ(camera.clock.state(), SenderClock::State::kFrozen);
  EXPECT_FALSE(camera.clock.time_of(camera.rtp_now(), kRate));
  EXPECT_FALSE(camera.clock.offset(camera.now()));
  camera.pass(5 * kSecond);
  camera.report();
  EXPECT_EQ(camera.clock.state(), SenderClock::State::kRunning);
}

TEST(SenderClock, AReportThatComesTwiceIsNoStandstill) {
  Camera camera;
  camera.report();
  camera.clock.report(camera.report_now(), camera.now(), kRate);
  EXPECT_EQ(camera.clock.state(), SenderClock::State::kRunning);
}

TEST(SenderClock, AStepIsCountedOnceAndRaisesTheEpoch) {
  for (const std::int64_t step : {kSecond, -kSecond, 3600 * kSecond}) {
    Camera camera;
    for (int i = 0; i < 5; ++i) {
      camera.report();
      camera.pass(5 * kSecond);
    }
    camera.step(step);
    for (int i = 0; i < 5; ++i) {
      camera.report();
      camera.pass(5 * kSecond);
    }
    EXPECT_EQ(camera.clock.steps(), 1u) << step;
    EXPECT_EQ(camera.clock.epoch(), 1u) << step;
    expect_near(*camera.clock.offset(camera.now()), step, 1000);
  }
}

TEST(SenderClock, ALateReportIsNoStep) {
  Camera camera;
  for (const std::int64_t delay : {0, 1500, 0}) {
    camera.report(delay * kMillisecond);
    camera.pass(5 * kSecond);
  }
  EXPECT_EQ(camera.clock.steps(), 0u);
}

TEST(SenderClock, ADriftOf500PartsOfAMillionIsMeasuredAndNoStep) {
  for (const std::int64_t parts : {500'000, -500'000}) {
    Camera camera;
    for (int i = 0; i < 60; ++i) {
      camera.report(i % 3 * kMillisecond);
      camera.pass(5 * kSecond, parts);
    }
    EXPECT_EQ(camera.clock.steps(), 0u);
    ASSERT_TRUE(camera.clock.rate());
    expect_near(*camera.clock.rate(), parts, 20'000);
    expect_near(*camera.clock.offset(camera.now()), 300 * kSecond / 1'000'000 * parts / 1000, 5 * kMillisecond);
  }
}

TEST(SenderClock, NoRateIsGivenBeforeTenSecondsOfReports) {
  Camera camera;
  for (int i = 0; i < 9; ++i) {
    camera.report();
    camera.pass(kSecond);
  }
  EXPECT_FALSE(camera.clock.rate());
  for (int i = 0; i < 8; ++i) {
    camera.report();
    camera.pass(kSecond);
  }
  EXPECT_TRUE(camera.clock.rate());
}

TEST(SenderClock, AnotherSourceIsAnotherEpoch) {
  Camera camera;
  camera.report();
  camera.clock.forget();
  EXPECT_EQ(camera.clock.state(), SenderClock::State::kUnknown);
  EXPECT_EQ(camera.clock.epoch(), 1u);
}

TEST(SenderClock, LocalTimeSentAsUtcIsAWholeNumberOfQuartersOfAnHour) {
  struct Case {
    std::int64_t offset;
    int minutes;
  };
  constexpr std::int64_t kMinute = 60 * kSecond;
  constexpr Case cases[] = {{0, 0},
                            {3 * kSecond, 0},
                            {60 * kMinute, 60},
                            {-300 * kMinute + 5 * kSecond, -300},
                            {345 * kMinute - 5 * kSecond, 345},
                            {345 * kMinute - 5 * kSecond - 1, 0},
                            {840 * kMinute, 840},
                            {855 * kMinute, 0},
                            {7 * kMinute, 0},
                            {-kHostStart, 0}};
  for (const Case& c : cases) EXPECT_EQ(local_time_minutes(c.offset), c.minutes) << c.offset;
}

TEST(SenderClock, NumbersOfAnySizeAreBorne) {
  SenderClock clock;
  const SenderReport reports[] = {{1, ~std::uint64_t{0}, 0}, {1, 1, ~std::uint32_t{0}}, {1, std::uint64_t{1} << 63, 5}};
  for (int i = 0; i < 30; ++i) {
    clock.report(reports[i % 3], {i * kSecond, i * kSecond}, i % 2 == 0 ? kRate : 1);
    (void)clock.time_of(0x80000000, 1);
    (void)clock.offset({0, 0});
  }
  EXPECT_FALSE(clock.time_of(1, 0));
}

}  // namespace
}  // namespace vexa
