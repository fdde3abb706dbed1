// SPDX-License-Identifier: Apache-2.0
#include "transport/wait_budget.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>

#include "tests/support/interruptions.h"

namespace vexa {
namespace {

class WaitBudgetTest : public testing::Test {
 protected:
  WaitBudgetTest() { EXPECT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends_), 0); }
  ~WaitBudgetTest() override {
    for (const int end : ends_) close(end);
  }

  void say() { EXPECT_EQ(write(ends_[1], "x", 1), 1); }

  int ends_[2] = {-1, -1};
};

TEST_F(WaitBudgetTest, ReportsWhenADescriptorIsReady) {
  EXPECT_EQ(WaitBudget(10000).wait_writable(ends_[0]), 1);
  say();
  EXPECT_EQ(WaitBudget(10000).wait_readable(ends_[0]), 1);
}

TEST_F(WaitBudgetTest, GivesZeroWhenTheBudgetIsUsedUp) {
  const WaitBudget budget(20);
  EXPECT_EQ(budget.wait_readable(ends_[0]), 0);
  EXPECT_EQ(budget.wait_readable(ends_[0]), 0);
  say();
  EXPECT_EQ(budget.wait_readable(ends_[0]), 1);
}

TEST_F(WaitBudgetTest, OfZeroOrLessDoesNotWait) {
  for (const int milliseconds : {0, -1, -1000000}) EXPECT_EQ(WaitBudget(milliseconds).wait_readable(ends_[0]), 0);
  say();
  for (const int milliseconds : {0, -1, -1000000}) EXPECT_EQ(WaitBudget(milliseconds).wait_readable(ends_[0]), 1);
}

TEST_F(WaitBudgetTest, ReadinessIsAlsoThePeersEnd) {
  EXPECT_EQ(shutdown(ends_[1], SHUT_WR), 0);
  EXPECT_EQ(WaitBudget(10000).wait_readable(ends_[0]), 1);
}

TEST_F(WaitBudgetTest, RefusesAClosedDescriptorAtOnce) {
  const int closed = dup(ends_[0]);
  close(closed);
  for (const int descriptor : {-1, -5, closed}) {
    errno = 0;
    EXPECT_EQ(WaitBudget(600000).wait_readable(descriptor), -1);
    EXPECT_EQ(errno, EBADF);
  }
}

TEST_F(WaitBudgetTest, EndsEarlyWhenTheStopDescriptorIsReady) {
  say();
  EXPECT_EQ(WaitBudget(600000).wait_readable_unless(ends_[1], ends_[0]), 0);
  EXPECT_EQ(WaitBudget(10000).wait_readable_unless(ends_[0], -1), 1);
}

TEST_F(WaitBudgetTest, PassesOverAStopDescriptorThatIsClosedOrHasNoWriter) {
  int pipe_ends[2];
  ASSERT_EQ(pipe2(pipe_ends, O_CLOEXEC), 0);
  close(pipe_ends[1]);
  const int closed = dup(ends_[0]);
  close(closed);
  for (const int stop : {pipe_ends[0], closed}) {
    EXPECT_EQ(WaitBudget(30).wait_readable_unless(ends_[0], stop), 0);
  }
  say();
  for (const int stop : {pipe_ends[0], closed}) {
    EXPECT_EQ(WaitBudget(10000).wait_readable_unless(ends_[0], stop), 1);
  }
  close(pipe_ends[0]);
}

TEST_F(WaitBudgetTest, GoesOnAfterASignal) {
  const vexa_test::Interruptions interruptions;
  EXPECT_TRUE(interruptions.come_during([this] { EXPECT_EQ(WaitBudget(50).wait_readable(ends_[0]), 0); }));
}

}  // namespace
}  // namespace vexa
