// SPDX-License-Identifier: Apache-2.0
// The header receive of RTSP answers, look by look.
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstring>
#include <thread>
#include <vector>

#include "tests/support/interruptions.h"
#include "tests/support/process_state.h"
#include "tests/support/test_driver.h"

namespace vexa_test {
namespace {

const std::string kAnswer = "RTSP/1.0 200 OK\r\nSession: 5\r\n\r\n";

class RtspHeader : public testing::Test {
 protected:
  RtspHeader() {
    driver_.soil_latest_error();
    std::memset(buffer_, '#', sizeof buffer_);
    EXPECT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends_), 0);
  }
  ~RtspHeader() override {
    for (const int end : ends_) close(end);
  }

  void say(const std::string& bytes) const {
    ASSERT_EQ(send(ends_[1], bytes.data(), bytes.size(), MSG_NOSIGNAL), static_cast<ssize_t>(bytes.size()));
  }
  int receive(int size, int timeout) { return driver_.rtp_over_tcp_header_recv(ends_[0], buffer_, size, timeout); }

  void expect_error(ELibDReturnCode code, const char* text) {
    EXPECT_EQ(driver_.LatestErrorCode(), code);
    EXPECT_EQ(driver_.LatestErrorText(), text);
  }

  TestDriver driver_;
  int ends_[2] = {-1, -1};
  char buffer_[1024];
};

TEST_F(RtspHeader, TakesAnAnswerWithItsBody) {
  say(kAnswer + "body");
  EXPECT_EQ(receive(1023, 1000), static_cast<int>(kAnswer.size() + 4));
  EXPECT_EQ(std::string(buffer_, kAnswer.size() + 4), kAnswer + "body");
  expect_error(LIBD_FAILED, "from before");
}

TEST_F(RtspHeader, SeesOnlyAPartOfAnAnswerLongerThanHalfTheBuffer) {
  const int length = static_cast<int>(kAnswer.size());
  for (const int size : {2 * length + 1, 2 * length, 2 * length - 1, length + 1, length}) {
    std::memset(buffer_, '#', sizeof buffer_);
    say(kAnswer);
    const int expected = std::min(length, size - length);
    EXPECT_EQ(receive(size, 1000), expected) << size;
    EXPECT_EQ(std::string(buffer_, kAnswer.size()), kAnswer);
    EXPECT_EQ(buffer_[size], '#') << "wrote past its size";
    // What was not taken stays on the connection.
    char rest[64];
    const ssize_t left = recv(ends_[0], rest, sizeof rest, MSG_DONTWAIT);
    EXPECT_EQ(std::max<ssize_t>(left, 0), length - expected);
  }
}

TEST_F(RtspHeader, ReadsAfterTheLastPeek) {
  const long thread = kernel_thread_id();
  say(kAnswer.substr(0, 21));
  std::thread camera([this, thread] {
    EXPECT_TRUE(eventually([thread] { return is_sleeping(thread); }));
    say(kAnswer.substr(21));
  });
  // The second peek puts the whole answer after the first 21 bytes; the read goes after that, and the caller, who
  // reads from the beginning, sees the first look and what fits of the second.
  EXPECT_EQ(receive(1023, 3000), static_cast<int>(kAnswer.size()));
  camera.join();
  EXPECT_EQ(std::string(buffer_, 21 + 2 * kAnswer.size()), kAnswer.substr(0, 21) + kAnswer + kAnswer);
}

TEST_F(RtspHeader, BelowASecondSeesNoAnswer) {
  for (const int timeout : {999, 1, 0, -1, -999}) {
    driver_.soil_latest_error();
    say(kAnswer);
    EXPECT_EQ(receive(1023, timeout), -1) << timeout;
    expect_error(LIBD_TIMEOUT, "Receive timed out");
  }
}

TEST_F(RtspHeader, TimesOutInSilence) {
  EXPECT_EQ(receive(1023, 30), -1);
  expect_error(LIBD_TIMEOUT, "Receive timed out");
}

TEST_F(RtspHeader, TimesOutOnEveryCutAnswerWhetherThePeerStaysOrCloses) {
  std::vector<std::thread> readers;
  for (std::size_t length = 1; length < kAnswer.size(); ++length) {
    readers.emplace_back([length] {
      int ends[2];
      ASSERT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends), 0);
      ASSERT_EQ(send(ends[1], kAnswer.data(), length, MSG_NOSIGNAL), static_cast<ssize_t>(length));
      if (length % 2 == 0) shutdown(ends[1], SHUT_WR);
      TestDriver driver;
      char buffer[1024];
      EXPECT_EQ(driver.rtp_over_tcp_header_recv(ends[0], buffer, 1023, 1000), -1) << length;
      EXPECT_EQ(driver.LatestErrorCode(), LIBD_TIMEOUT);
      EXPECT_EQ(driver.LatestErrorText(), "Receive timed out");
      for (const int end : ends) close(end);
    });
  }
  for (std::thread& reader : readers) reader.join();
}

TEST_F(RtspHeader, TimesOutOnGarbageThatFillsTheBuffer) {
  say(std::string(5000, 'g'));
  EXPECT_EQ(receive(1023, 2000), -1);
  expect_error(LIBD_TIMEOUT, "Receive timed out");
  EXPECT_EQ(buffer_[1023], '#');
}

TEST_F(RtspHeader, TakesNothingFromWhatWasInTheBuffer) {
  std::memcpy(buffer_, "\r\n\r\n", 4);
  std::memcpy(buffer_ + 3, "\r\n\r\n", 4);
  say("RT");
  EXPECT_EQ(receive(1023, 1000), -1);
  expect_error(LIBD_TIMEOUT, "Receive timed out");
}

TEST_F(RtspHeader, ReadsWithoutPeekingWhenTheTimeOutIsASecondBelowZero) {
  say("no header");
  EXPECT_EQ(receive(1023, -1000), 9);
}

TEST_F(RtspHeader, ReportsSystemErrors) {
  EXPECT_EQ(driver_.rtp_over_tcp_header_recv(-1, buffer_, 1023, 1000), -1);
  expect_error(LIBD_FAILED, "Bad file descriptor");
  int ends[2];
  ASSERT_EQ(pipe(ends), 0);
  ASSERT_EQ(write(ends[1], "x", 1), 1);
  EXPECT_EQ(driver_.rtp_over_tcp_header_recv(ends[0], buffer_, 1023, 1000), -1);
  expect_error(LIBD_FAILED, "Socket operation on non-socket");
  for (const int end : ends) close(end);
}

TEST_F(RtspHeader, WaitsOutSignals) {
  const Interruptions interruptions;
  EXPECT_TRUE(interruptions.come_during([this] {
    driver_.soil_latest_error();
    EXPECT_EQ(receive(1023, 50), -1);
    expect_error(LIBD_TIMEOUT, "Receive timed out");
  }));
}

}  // namespace
}  // namespace vexa_test
