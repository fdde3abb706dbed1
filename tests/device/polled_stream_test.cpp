#include "device/polled_stream.h"

#include <gtest/gtest.h>
#include <sys/socket.h>

#include <climits>

#include "tests/support/process_state.h"
#include "transport/failure.h"

namespace vexa {
namespace {

struct SilenceRow {
  std::time_t now;
  int timeout;
  bool silent;
};

TEST(AlarmSilence, BeginsAfterTheTimeOutAnd15Seconds) {
  const SilenceRow rows[] = {{100, 0, false},       {115, 0, false},     {116, 0, true},      {115, 999, false},
                             {116, 999, true},      {125, 10000, false}, {126, 10000, true},  {125, 10999, false},
                             {126, 10999, true},    {99, 0, false},      {0, INT_MAX, false}, {115, -1, false},
                             {2000, INT_MAX, false}};
  for (const auto& row : rows) {
    EXPECT_EQ(is_silent(row.now, 100, whole_seconds(row.timeout) + 15000), row.silent) << row.now << ' ' << row.timeout;
  }
}

TEST(MetadataSilence, BeginsAfterTheTimeOutWithoutGrace) {
  const SilenceRow rows[] = {{100, 0, false},          {101, 0, true},      {101, 999, true},   {101, 1000, false},
                             {102, 1999, true},        {110, 10000, false}, {111, 10000, true}, {105, 10000, false},
                             {INT_MAX, INT_MAX, true}, {99, 0, false},      {100, -1, true}};
  for (const auto& row : rows) {
    EXPECT_EQ(is_silent(row.now, 100, row.timeout), row.silent) << row.now << ' ' << row.timeout;
  }
}

TEST(VideoSilence, CountsWholeSecondsOfTheTimeOut) {
  const SilenceRow rows[] = {{100, 0, false},   {101, 0, true}, {101, 999, true}, {101, 1000, false},
                             {102, 1999, true}, {99, 0, false}, {100, -1, false}};
  for (const auto& row : rows) {
    EXPECT_EQ(is_silent(row.now, 100, whole_seconds(row.timeout)), row.silent) << row.now << ' ' << row.timeout;
  }
}

TEST(Silence, BeginsInTheSecondThatIsNamed) {
  for (const std::int64_t patience :
       {std::int64_t{0}, std::int64_t{1}, std::int64_t{999}, std::int64_t{1000}, std::int64_t{1001},
        std::int64_t{INT_MAX} + 15000, std::int64_t{-1}, std::int64_t{-1000}, std::int64_t{-1001}}) {
    const auto from = static_cast<std::time_t>(silent_from(100, patience));
    EXPECT_TRUE(is_silent(from, 100, patience)) << patience;
    EXPECT_FALSE(is_silent(from - 1, 100, patience)) << patience;
  }
}

class Polled : public testing::Test {
 protected:
  static Result<Socket> open() { return Socket(socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)); }

  ELibDReturnCode poll(Result<int> read) {
    const Outcome outcome = stream_.poll([&](int) { return read; }, [this] { return now_; }, 5000);
    return outcome ? *outcome : outcome.failure().code;
  }

  ELibDReturnCode start() {
    const Outcome outcome = stream_.start(
        open, [this] { return now_; }, 5000);
    return outcome ? *outcome : outcome.failure().code;
  }

  CSimpleLock lock_;
  int socket_ = -1;
  std::time_t last_ = 0;
  std::time_t now_ = 100;
  SecondsClock system_clock_ = [] { return std::time_t{100}; };
  Readiness readiness_{nullptr, system_clock_};
  PolledStream stream_{{lock_, socket_, last_}, {readiness_, kAudioStream}};
  const std::size_t descriptors_ = vexa_test::open_descriptors();
};

TEST_F(Polled, FailsWithoutAReadingWhileItIsClosed) {
  EXPECT_EQ(poll(1), LIBD_FAILED);
  EXPECT_EQ(last_, 0);
  EXPECT_FALSE(stream_.stop());
}

TEST_F(Polled, CountsItsSilenceFromTheOpening) {
  ASSERT_EQ(start(), LIBD_OK);
  EXPECT_EQ(last_, 100);
  now_ = 105;
  EXPECT_EQ(poll(0), LIBD_NO_FRAME);
  now_ = 106;
  EXPECT_EQ(poll(0), LIBD_TIMEOUT);
  EXPECT_TRUE(stream_.stop());
}

TEST_F(Polled, CountsItsSilenceFromTheLastData) {
  ASSERT_EQ(start(), LIBD_OK);
  now_ = 106;
  EXPECT_EQ(poll(7), LIBD_OK);
  now_ = 111;
  EXPECT_EQ(poll(0), LIBD_NO_FRAME);
  EXPECT_TRUE(stream_.stop());
}

TEST_F(Polled, ReturnsWhyAReadingFailed) {
  ASSERT_EQ(start(), LIBD_OK);
  now_ = 200;
  EXPECT_EQ(poll(kReceiveTimedOut), LIBD_TIMEOUT);
  EXPECT_EQ(last_, 100);
  EXPECT_TRUE(stream_.stop());
}

TEST_F(Polled, ClosesWhatWasOpenWhenItIsOpenedAgain) {
  ASSERT_EQ(start(), LIBD_OK);
  ASSERT_EQ(start(), LIBD_OK);
  EXPECT_EQ(vexa_test::open_descriptors(), descriptors_ + 1);
  EXPECT_TRUE(stream_.stop());
  EXPECT_EQ(vexa_test::open_descriptors(), descriptors_);
  EXPECT_EQ(socket_, -1);
}

TEST_F(Polled, StaysClosedWhenItCannotBeOpened) {
  ASSERT_EQ(start(), LIBD_OK);
  const Outcome outcome = stream_.start(
      []() -> Result<Socket> {
        return Failure{LIBD_UNAUTHORIZED, "no"};
      },
      [] { return std::time_t{7}; }, 5000);
  ASSERT_FALSE(outcome);
  EXPECT_EQ(outcome.failure().code, LIBD_UNAUTHORIZED);
  EXPECT_EQ(socket_, -1);
  EXPECT_EQ(last_, 100);
  EXPECT_EQ(vexa_test::open_descriptors(), descriptors_);
}

}  // namespace
}  // namespace vexa
