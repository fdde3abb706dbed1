#include "transport/cancel_signal.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <string>
#include <thread>
#include <vector>

#include "transport/http_receive.h"
#include "transport/wait_budget.h"

namespace vexa {
namespace {

constexpr int kLong = 600000;

/// A connection whose other end says nothing.
class SilentPeer {
 public:
  SilentPeer() { EXPECT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends_), 0); }
  ~SilentPeer() {
    for (const int end : ends_) close(end);
  }
  SilentPeer(const SilentPeer&) = delete;
  SilentPeer& operator=(const SilentPeer&) = delete;

  int here() const { return ends_[0]; }
  int there() const { return ends_[1]; }

 private:
  int ends_[2] = {-1, -1};
};

/// While it lives, the process gets no further descriptor.
class NoDescriptors {
 public:
  NoDescriptors() {
    getrlimit(RLIMIT_NOFILE, &before_);
    rlimit few = before_;
    few.rlim_cur = kFew;
    setrlimit(RLIMIT_NOFILE, &few);
    for (int taken = 0; taken != -1;) {
      taken = dup(STDERR_FILENO);
      if (taken != -1) taken_.push_back(taken);
    }
  }
  ~NoDescriptors() {
    for (const int descriptor : taken_) close(descriptor);
    setrlimit(RLIMIT_NOFILE, &before_);
  }
  NoDescriptors(const NoDescriptors&) = delete;
  NoDescriptors& operator=(const NoDescriptors&) = delete;

 private:
  static constexpr rlim_t kFew = 64;

  rlimit before_{};
  std::vector<int> taken_;
};

TEST(CancelSignal, IsRaisedUntilItIsLowered) {
  CancelSignal signal;
  EXPECT_FALSE(signal.is_raised());
  signal.raise();
  signal.raise();
  EXPECT_TRUE(signal.is_raised());
  EXPECT_TRUE(signal.is_raised());
  signal.lower();
  EXPECT_FALSE(signal.is_raised());
  signal.lower();
  signal.raise();
  EXPECT_TRUE(signal.is_raised());
}

TEST(CancelSignal, LeavesErrno) {
  CancelSignal signal;
  errno = ERANGE;
  signal.lower();
  signal.raise();
  EXPECT_EQ(errno, ERANGE);
}

TEST(CancelSignal, IsNotInherited) {
  const CancelSignal signal;
  EXPECT_NE(fcntl(signal.descriptor(), F_GETFD) & FD_CLOEXEC, 0);
}

TEST(CancelSignal, EndsEveryKindOfWaitAtOnce) {
  CancelSignal signal;
  signal.raise();
  for (const Cancels cancels :
       {Cancels{&signal}, Cancels{nullptr, &signal}, Cancels{nullptr, nullptr, signal.descriptor()}}) {
    const SilentPeer peer;
    const WaitBudget budget({kLong, cancels});
    EXPECT_EQ(budget.wait_readable(peer.here()), 0);
    EXPECT_EQ(budget.wait_writable(peer.here()), 0);
    EXPECT_EQ(budget.wait_closed(peer.here()), 0);
    EXPECT_EQ(budget.wait_readable_unless(peer.here(), -1), 0);
    budget.pause();
  }
}

TEST(CancelSignal, EndsAWaitThatHasBegun) {
  CancelSignal signal;
  const SilentPeer peer;
  std::thread canceller([&] { signal.raise(); });
  EXPECT_EQ(WaitBudget({kLong, {&signal}}).wait_readable(peer.here()), 0);
  canceller.join();
}

TEST(CancelSignal, WithoutADescriptorEndsAWaitThatHasBegunToo) {
  const SilentPeer peer;
  const NoDescriptors none;
  CancelSignal signal;
  ASSERT_EQ(signal.descriptor(), -1);
  EXPECT_FALSE(signal.is_raised());
  EXPECT_EQ(WaitBudget({60, {&signal}}).wait_readable(peer.here()), 0);
  std::thread canceller([&] { signal.raise(); });
  EXPECT_EQ(WaitBudget({kLong, {nullptr, &signal}}).wait_readable(peer.here()), 0);
  canceller.join();
  EXPECT_TRUE(signal.is_raised());
  signal.lower();
  EXPECT_FALSE(signal.is_raised());
  EXPECT_EQ(WaitBudget({kLong, {&signal}}).wait_writable(peer.here()), 1);
}

CancelSignal* handled = nullptr;

TEST(CancelSignal, IsRaisedByASignalHandler) {
  CancelSignal signal;
  handled = &signal;
  struct sigaction before {};
  struct sigaction action {};
  action.sa_handler = [](int) { handled->raise(); };
  sigaction(SIGUSR1, &action, &before);
  const SilentPeer peer;
  raise(SIGUSR1);
  EXPECT_EQ(WaitBudget({kLong, {&signal}}).wait_readable(peer.here()), 0);
  sigaction(SIGUSR1, &before, nullptr);
}

TEST(WaitClosed, EndsWhenThePeerHasClosedAndNotWhenItHasSpoken) {
  const SilentPeer peer;
  EXPECT_EQ(send(peer.there(), "x", 1, MSG_NOSIGNAL), 1);
  EXPECT_EQ(WaitBudget(0).wait_closed(peer.here()), 0);
  EXPECT_EQ(shutdown(peer.there(), SHUT_WR), 0);
  EXPECT_EQ(WaitBudget(kLong).wait_closed(peer.here()), 1);
}

TEST(ReceiveHeader, EndsAtOnceWhenThePeerHasClosedWithoutOne) {
  for (const std::string& begun : {std::string(), std::string("HTTP/1.0 200 OK\r\nDate: ")}) {
    const SilentPeer peer;
    EXPECT_EQ(send(peer.there(), begun.data(), begun.size(), MSG_NOSIGNAL), static_cast<ssize_t>(begun.size()));
    EXPECT_EQ(shutdown(peer.there(), SHUT_WR), 0);
    char room[256];
    const auto length = receive_header(peer.here(), room, kLong);
    ASSERT_TRUE(length);
    EXPECT_EQ(*length, 0);
  }
}

TEST(ReceiveHeader, TakesTheWholeOfOneWhosePeerHasClosed) {
  const SilentPeer peer;
  const std::string header = "HTTP/1.0 200 OK\r\n\r\n";
  EXPECT_EQ(send(peer.there(), header.data(), header.size(), MSG_NOSIGNAL), static_cast<ssize_t>(header.size()));
  EXPECT_EQ(shutdown(peer.there(), SHUT_WR), 0);
  char room[256];
  const auto length = receive_header(peer.here(), room, kLong);
  ASSERT_TRUE(length);
  EXPECT_EQ(*length, static_cast<int>(header.size()));
}

TEST(ReceiveHeader, OfAPeerThatHasBegunIsCancelled) {
  CancelSignal signal;
  signal.raise();
  const SilentPeer peer;
  EXPECT_EQ(send(peer.there(), "HTTP", 4, MSG_NOSIGNAL), 4);
  char room[256];
  const auto length = receive_header(peer.here(), room, {kLong, {&signal}});
  ASSERT_TRUE(length);
  EXPECT_EQ(*length, 0);
}

}  // namespace
}  // namespace vexa
