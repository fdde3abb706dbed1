// SPDX-License-Identifier: Apache-2.0
// The reading functions of the HTTP client, on sockets of the test's own.
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <atomic>
#include <climits>
#include <cstring>
#include <thread>

#include "tests/support/test_driver.h"

namespace vexa_test {
namespace {

class HttpReceive : public testing::Test {
 protected:
  HttpReceive() {
    driver_.soil_latest_error();
    pair(SOCK_STREAM);
  }
  ~HttpReceive() override {
    for (const int end : {socket_, camera_}) close(end);
    for (const int end : pipe_) close(end);
  }

  /// A connection of another kind: with SOCK_SEQPACKET each read gives what was sent at once.
  void pair(int type) {
    for (const int end : {socket_, camera_}) close(end);
    int ends[2];
    ASSERT_EQ(socketpair(AF_UNIX, type | SOCK_CLOEXEC, 0, ends), 0);
    socket_ = ends[0];
    camera_ = ends[1];
  }

  void say(const std::string& bytes) const {
    ASSERT_EQ(send(camera_, bytes.data(), bytes.size(), MSG_NOSIGNAL), static_cast<ssize_t>(bytes.size()));
  }
  void hang_up() { shutdown(camera_, SHUT_WR); }

  /// A descriptor that is ready and cannot be received from.
  int no_socket() {
    EXPECT_EQ(pipe(pipe_), 0);
    EXPECT_EQ(write(pipe_[1], "x", 1), 1);
    return pipe_[0];
  }

  void expect_error(ELibDReturnCode code, const char* text) {
    EXPECT_EQ(driver_.LatestErrorCode(), code);
    EXPECT_EQ(driver_.LatestErrorText(), text);
  }

  /// `receive`, called with a descriptor, fails as the system does.
  template <typename Receive>
  void expect_system_errors(Receive receive) {
    EXPECT_EQ(receive(-1), -1);
    expect_error(LIBD_FAILED, "Bad file descriptor");
    EXPECT_EQ(receive(no_socket()), -1);
    expect_error(LIBD_FAILED, "Socket operation on non-socket");
  }

  TestDriver driver_;
  int socket_ = -1;
  int camera_ = -1;
  int pipe_[2] = {-1, -1};
  char buffer_[1024] = {};
};

using HttpHeaderRecv = HttpReceive;

TEST_F(HttpHeaderRecv, TakesTheHeaderAlone) {
  say("HTTP/1.0 200 OK\r\n\r\nbody");
  EXPECT_EQ(driver_.http_header_recv(socket_, buffer_, 1023, 5000), 19);
  EXPECT_EQ(driver_.http_recv(socket_, buffer_, 1023, 5000), 4);
  EXPECT_EQ(std::string(buffer_, 4), "body");
  expect_error(LIBD_FAILED, "from before");
}

TEST_F(HttpHeaderRecv, TakesUpToTheCarriageReturnsEvenAfterTwoLineFeeds) {
  say("part one\n\npart two\r\n\r\nbody");
  EXPECT_EQ(driver_.http_header_recv(socket_, buffer_, 1023, 5000), 22);
}

TEST_F(HttpHeaderRecv, GivesZeroInSilenceWithoutAWord) {
  for (const int timeout : {20, 0, -1}) EXPECT_EQ(driver_.http_header_recv(socket_, buffer_, 1023, timeout), 0);
  expect_error(LIBD_FAILED, "from before");
}

TEST_F(HttpHeaderRecv, BelowTenMillisecondsLooksOnce) {
  say("HTTP/1.0 200 OK\r\n");
  for (const int timeout : {9, 1, 0, -1, INT_MIN}) {
    EXPECT_EQ(driver_.http_header_recv(socket_, buffer_, 1023, timeout), 0);
  }
  say("\r\n");
  EXPECT_EQ(driver_.http_header_recv(socket_, buffer_, 1023, 0), 19);
}

TEST_F(HttpHeaderRecv, LooksAgainEveryTenMilliseconds) {
  say("HTTP/1.0 200 OK\r\n");
  std::thread camera([this] { say("\r\n"); });
  EXPECT_EQ(driver_.http_header_recv(socket_, buffer_, 1023, 20000), 19);
  camera.join();
}

TEST_F(HttpHeaderRecv, EndsATrickleWithItsTimeOut) {
  std::atomic<bool> ended{false};
  std::thread camera([&] {
    while (!ended && send(camera_, "x", 1, MSG_NOSIGNAL) == 1) std::this_thread::yield();
  });
  EXPECT_EQ(driver_.http_header_recv(socket_, buffer_, 1023, 50), 0);
  ended = true;
  shutdown(camera_, SHUT_RDWR);
  camera.join();
}

TEST_F(HttpHeaderRecv, GivesZeroWhenThePeerClosesWithin) {
  say("HTTP/1.0");
  hang_up();
  EXPECT_EQ(driver_.http_header_recv(socket_, buffer_, 1023, 30), 0);
  expect_error(LIBD_FAILED, "from before");
}

TEST_F(HttpHeaderRecv, LooksNoFurtherThanItsLength) {
  say("HTTP/1.0 200 OK\r\n\r\n");
  std::memset(buffer_, '#', sizeof buffer_);
  for (const int length : {-1, 0, 18}) EXPECT_EQ(driver_.http_header_recv(socket_, buffer_, length, 10), 0) << length;
  EXPECT_EQ(buffer_[18], '#');
  EXPECT_EQ(driver_.http_header_recv(socket_, buffer_, 19, 10), 19);
  EXPECT_EQ(buffer_[19], '#');
}

TEST_F(HttpHeaderRecv, ReportsSystemErrors) {
  expect_system_errors([this](int socket) { return driver_.http_header_recv(socket, buffer_, 1023, 5000); });
}

using HttpRecv = HttpReceive;

TEST_F(HttpRecv, GivesWhatOneReadGives) {
  say("hello");
  EXPECT_EQ(driver_.http_recv(socket_, buffer_, 3, 5000), 3);
  EXPECT_EQ(driver_.http_recv(socket_, buffer_, 1024, 5000), 2);
  expect_error(LIBD_FAILED, "from before");
}

TEST_F(HttpRecv, GivesZeroInSilenceAndAtTheEnd) {
  for (const int timeout : {20, 0, -5}) EXPECT_EQ(driver_.http_recv(socket_, buffer_, 1024, timeout), 0);
  hang_up();
  EXPECT_EQ(driver_.http_recv(socket_, buffer_, 1024, 5000), 0);
  expect_error(LIBD_FAILED, "from before");
}

TEST_F(HttpRecv, ReportsSystemErrors) {
  expect_system_errors([this](int socket) { return driver_.http_recv(socket, buffer_, 1024, 5000); });
}

using HttpRecvn = HttpReceive;

TEST_F(HttpRecvn, ReadsExactlyTheLength) {
  say("hello world");
  EXPECT_EQ(driver_.http_recvn(socket_, buffer_, 5, 5000), 5);
  EXPECT_STREQ(buffer_, "hello");
  expect_error(LIBD_FAILED, "from before");
}

TEST_F(HttpRecvn, GathersPieces) {
  pair(SOCK_SEQPACKET);
  for (const char* piece : {"a", "bc", "def"}) say(piece);
  EXPECT_EQ(driver_.http_recvn(socket_, buffer_, 6, 5000), 6);
  EXPECT_STREQ(buffer_, "abcdef");
}

TEST_F(HttpRecvn, OfZeroBytesGivesZeroAtOnce) {
  EXPECT_EQ(driver_.http_recvn(-1, buffer_, 0, 5000), 0);
  EXPECT_EQ(driver_.http_recvn(-1, buffer_, -1, 5000), 0);
  expect_error(LIBD_FAILED, "from before");
}

TEST_F(HttpRecvn, GivesWhatCameBeforeThePeerClosed) {
  say("abc");
  hang_up();
  EXPECT_EQ(driver_.http_recvn(socket_, buffer_, 10, 5000), 3);
  EXPECT_EQ(driver_.http_recvn(socket_, buffer_, 10, 5000), 0);
}

TEST_F(HttpRecvn, TimesOut) {
  say("abc");
  for (const int timeout : {20, 0, -1}) {
    EXPECT_EQ(driver_.http_recvn(socket_, buffer_, 10, timeout), -1);
    expect_error(LIBD_TIMEOUT, "Receive timed out");
  }
}

TEST_F(HttpRecvn, ReportsSystemErrors) {
  expect_system_errors([this](int socket) { return driver_.http_recvn(socket, buffer_, 1, 5000); });
}

using HttpRecvnText = HttpReceive;

TEST_F(HttpRecvnText, AppendsUntilThePeerCloses) {
  pair(SOCK_SEQPACKET);
  for (const std::string& piece : {std::string("abc"), std::string(4096, 'x'), std::string("\0end", 4)}) say(piece);
  hang_up();
  std::string text = "before ";
  EXPECT_EQ(driver_.http_recvn(socket_, text, 0, 5000), 7 + 3 + 4096 + 4);
  EXPECT_EQ(text, "before abc" + std::string(4096, 'x') + std::string("\0end", 4));
  expect_error(LIBD_FAILED, "from before");
}

TEST_F(HttpRecvnText, StopsWhenAReadGivesExactlyWhatIsMissing) {
  pair(SOCK_SEQPACKET);
  for (const char* piece : {"abcd", "efghij", "more"}) say(piece);
  std::string text;
  EXPECT_EQ(driver_.http_recvn(socket_, text, 10, 5000), 10);
  EXPECT_EQ(text, "abcdefghij");
}

TEST_F(HttpRecvnText, DoesNotStopAtAReadThatGivesMoreThanIsMissing) {
  pair(SOCK_SEQPACKET);
  for (const char* piece : {"abcd", "efghijkl", "m"}) say(piece);
  std::string text;
  EXPECT_EQ(driver_.http_recvn(socket_, text, 10, 20), -1);
  expect_error(LIBD_TIMEOUT, "Receive timed out");
  EXPECT_EQ(text, "abcdefghijklm");
  hang_up();
  EXPECT_EQ(driver_.http_recvn(socket_, text, 10, 5000), 13);
}

TEST_F(HttpRecvnText, KeepsWhatCameBeforeAFailure) {
  say("abc");
  std::string text;
  for (const int timeout : {20, 0, -1}) {
    EXPECT_EQ(driver_.http_recvn(socket_, text, 0, timeout), -1);
    expect_error(LIBD_TIMEOUT, "Receive timed out");
  }
  EXPECT_EQ(text, "abc");
  expect_system_errors([&](int socket) { return driver_.http_recvn(socket, text, 0, 5000); });
  EXPECT_EQ(text, "abc");
}

TEST_F(HttpRecvnText, EndsAnAnswerWithoutEnd) {
  std::thread camera([this] {
    const std::string piece(65536, 'x');
    while (send(camera_, piece.data(), piece.size(), MSG_NOSIGNAL) > 0) {
    }
  });
  std::string text;
  EXPECT_EQ(driver_.http_recvn(socket_, text, 0, 600000), -1);
  expect_error(LIBD_TIMEOUT, "Receive timed out");
  EXPECT_LT(text.size(), (std::size_t{32} << 20) + 4097);
  shutdown(socket_, SHUT_RDWR);
  camera.join();
}

TEST(AddUrlEncoding, SparesWhatBelongsToUrlsUnlessAllIsEncoded) {
  TestDriver driver;
  EXPECT_EQ(driver.AddUrlEncoding("a b/c", false), "a%20b/c");
  EXPECT_EQ(driver.AddUrlEncoding("a b/c", true), "a%20b%2Fc");
  EXPECT_EQ(driver.AddUrlEncoding("$-_.+!*'(),/?&#=", false), "$-_.+!*'(),/?&#=");
  EXPECT_EQ(driver.AddUrlEncoding("$-_.+!*'(),/?&#=", true), "%24%2D%5F%2E%2B%21%2A%27%28%29%2C%2F%3F%26%23%3D");
  EXPECT_EQ(driver.AddUrlEncoding("\xe4%~", false), "%E4%25%7E");
  EXPECT_EQ(driver.AddUrlEncoding("", true), "");
}

TEST(GetUrlParameter, FindsAKeyInsideALongerOne) {
  TestDriver driver;
  std::string value;
  EXPECT_TRUE(driver.GetUrlParameter("DigitalZoom=on&Zoom=2", "Zoom=", value));
  EXPECT_EQ(value, "on");
}

TEST(GetUrlParameter, SetsAnEmptyValueAndReturnsFalse) {
  TestDriver driver;
  std::string value = "before";
  EXPECT_FALSE(driver.GetUrlParameter("A=&B=1", "A=", value));
  EXPECT_EQ(value, "");
}

TEST(GetUrlParameter, LeavesTheValueWithoutTheKey) {
  TestDriver driver;
  std::string value = "before";
  EXPECT_FALSE(driver.GetUrlParameter("B=1", "A=", value));
  EXPECT_EQ(value, "before");
}

TEST(GetUrlParameter, ReadsNumbersAsStrtolDoes) {
  TestDriver driver;
  const struct {
    const char* answer;
    bool found;
    int value;
  } cases[] = {{"A=12&B=1", true, 12}, {"A= -7x", true, -7},
               {"A=x", true, 0},       {"A=&B=1", false, 99},
               {"B=1", false, 99},     {"A=99999999999", true, INT_MAX},
               {"A=+3", true, 3},      {"A=-99999999999", true, INT_MIN}};
  for (const auto& c : cases) {
    int value = 99;
    EXPECT_EQ(driver.GetUrlParameter(c.answer, "A=", value), c.found) << c.answer;
    EXPECT_EQ(value, c.value) << c.answer;
  }
}

TEST(Base64Encode, EndsItsOutputWithANul) {
  TestDriver driver;
  char output[] = "##########";
  driver.base64Encode("admin", output);
  EXPECT_STREQ(output, "YWRtaW4=");
  EXPECT_EQ(output[9], '#');
}

TEST(WaitFailure, GivesEachEndOfAWaitItsText) {
  errno = EINVAL;
  const vexa::Failure broken = vexa::wait_failure(-1, vexa::kReceiveTimedOut);
  EXPECT_EQ(broken.text, "Invalid argument");
  EXPECT_EQ(broken.code, LIBD_FAILED);
  const vexa::Failure strange = vexa::wait_failure(2, vexa::kReceiveTimedOut);
  EXPECT_EQ(strange.text, "Strange status");
  EXPECT_EQ(strange.code, LIBD_FAILED);
  const vexa::Failure expired = vexa::wait_failure(0, vexa::kConnectTimedOut);
  EXPECT_EQ(expired.text, "Connection timed out");
  EXPECT_EQ(expired.code, LIBD_TIMEOUT);
}

}  // namespace
}  // namespace vexa_test
