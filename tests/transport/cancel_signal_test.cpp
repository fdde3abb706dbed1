// SPDX-License-Identifier: Apache-2.0
#include "transport/cancel_signal.h"

#include <fcntl.h>
#include <gtest/gtest.h>

#include <cerrno>
#include <csignal>
#include <optional>
#include <string>
#include <thread>

#include "tests/support/descriptors.h"
#include "tests/support/process_state.h"
#include "tests/support/stream_pair.h"
#include "transport/http_receive.h"
#include "transport/wait_budget.h"

namespace vexa {
namespace {

using vexa_test::eventually;
using vexa_test::is_sleeping;
using vexa_test::kernel_thread_id;
using vexa_test::NoDescriptorsLeft;
using vexa_test::StreamPair;

constexpr int kLong = 600000;

/// Raises the signal once `waiter` waits.
std::thread raise_for(long waiter, CancelSignal& signal) {
  return std::thread([waiter, &signal] {
    EXPECT_TRUE(eventually([waiter] { return is_sleeping(waiter); }));
    signal.raise();
  });
}

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
    const StreamPair peer;
    const WaitBudget budget({kLong, cancels});
    EXPECT_EQ(budget.wait_readable(peer.driver_end()), 0);
    EXPECT_EQ(budget.wait_writable(peer.driver_end()), 0);
    EXPECT_EQ(budget.wait_closed(peer.driver_end()), 0);
    EXPECT_EQ(budget.wait_readable_unless(peer.driver_end(), -1), 0);
    budget.pause();
  }
}

TEST(CancelSignal, EndsAWaitThatHasBegun) {
  CancelSignal signal;
  const StreamPair peer;
  std::thread canceller = raise_for(kernel_thread_id(), signal);
  EXPECT_EQ(WaitBudget({kLong, {&signal}}).wait_readable(peer.driver_end()), 0);
  canceller.join();
}

TEST(CancelSignal, WithoutADescriptorEndsAWaitThatHasBegunToo) {
  const StreamPair peer;
  std::optional<NoDescriptorsLeft> none(std::in_place);
  CancelSignal signal;
  none.reset();
  ASSERT_EQ(signal.descriptor(), -1);
  EXPECT_FALSE(signal.is_raised());
  EXPECT_EQ(WaitBudget({60, {&signal}}).wait_readable(peer.driver_end()), 0);
  std::thread canceller = raise_for(kernel_thread_id(), signal);
  EXPECT_EQ(WaitBudget({kLong, {nullptr, &signal}}).wait_readable(peer.driver_end()), 0);
  canceller.join();
  EXPECT_TRUE(signal.is_raised());
  signal.lower();
  EXPECT_FALSE(signal.is_raised());
  EXPECT_EQ(WaitBudget({kLong, {&signal}}).wait_writable(peer.driver_end()), 1);
}

CancelSignal* handled = nullptr;

TEST(CancelSignal, IsRaisedByASignalHandler) {
  CancelSignal signal;
  handled = &signal;
  struct sigaction before {};
  struct sigaction action {};
  action.sa_handler = [](int) { handled->raise(); };
  sigaction(SIGUSR1, &action, &before);
  const StreamPair peer;
  raise(SIGUSR1);
  EXPECT_EQ(WaitBudget({kLong, {&signal}}).wait_readable(peer.driver_end()), 0);
  sigaction(SIGUSR1, &before, nullptr);
}

TEST(WaitClosed, EndsWhenThePeerHasClosedAndNotWhenItHasSpoken) {
  StreamPair peer;
  peer.say("x");
  EXPECT_EQ(WaitBudget(0).wait_closed(peer.driver_end()), 0);
  peer.hang_up();
  EXPECT_EQ(WaitBudget(kLong).wait_closed(peer.driver_end()), 1);
}

TEST(ReceiveHeader, EndsAtOnceWhenThePeerHasClosedWithoutOne) {
  for (const std::string& begun : {std::string(), std::string("HTTP/1.0 200 OK\r\nDate: ")}) {
    StreamPair peer;
    peer.say(begun);
    peer.hang_up();
    char room[256];
    const auto length = receive_header(peer.driver_end(), room, kLong);
    ASSERT_TRUE(length);
    EXPECT_EQ(*length, 0);
  }
}

TEST(ReceiveHeader, TakesTheWholeOfOneWhosePeerHasClosed) {
  StreamPair peer;
  const std::string header = "HTTP/1.0 200 OK\r\n\r\n";
  peer.say(header);
  peer.hang_up();
  char room[256];
  const auto length = receive_header(peer.driver_end(), room, kLong);
  ASSERT_TRUE(length);
  EXPECT_EQ(*length, static_cast<int>(header.size()));
}

TEST(ReceiveHeader, OfAPeerThatHasBegunIsCancelled) {
  CancelSignal signal;
  signal.raise();
  const StreamPair peer;
  peer.say("HTTP");
  char room[256];
  const auto length = receive_header(peer.driver_end(), room, {kLong, {&signal}});
  ASSERT_TRUE(length);
  EXPECT_EQ(*length, 0);
}

}  // namespace
}  // namespace vexa
