// SPDX-License-Identifier: Apache-2.0
#include "transport/socket.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <string>

#include "tests/support/process_state.h"

namespace vexa {
namespace {

int made_socket() { return socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0); }

TEST(Socket, ClosesWhatItOwns) {
  const std::size_t before = vexa_test::open_descriptors();
  {
    const Socket owned(made_socket());
    EXPECT_TRUE(owned.valid());
    EXPECT_EQ(vexa_test::open_descriptors(), before + 1);
  }
  EXPECT_EQ(vexa_test::open_descriptors(), before);
}

TEST(Socket, LetsGoOfWhatItReleases) {
  Socket owned(made_socket());
  const int released = owned.release();
  EXPECT_FALSE(owned.valid());
  EXPECT_EQ(owned.get(), -1);
  EXPECT_EQ(close(released), 0);
}

TEST(Socket, MovesItsOwnership) {
  const std::size_t before = vexa_test::open_descriptors();
  Socket first(made_socket());
  const int descriptor = first.get();
  Socket second(std::move(first));
  EXPECT_EQ(second.get(), descriptor);
  Socket third(made_socket());
  third = std::move(second);
  EXPECT_EQ(third.get(), descriptor);
  EXPECT_EQ(vexa_test::open_descriptors(), before + 1);
  third = Socket();
  EXPECT_EQ(vexa_test::open_descriptors(), before);
}

TEST(SendOnce, SendsAll) {
  int ends[2];
  ASSERT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends), 0);
  EXPECT_TRUE(send_once(ends[0], "hello", 5));
  char heard[8] = {};
  EXPECT_EQ(read(ends[1], heard, sizeof heard), 5);
  EXPECT_STREQ(heard, "hello");
  for (const int end : ends) close(end);
}

TEST(SendOnce, ToAPeerThatHasClosedIsAnErrorAndNoSignal) {
  int ends[2];
  ASSERT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends), 0);
  close(ends[1]);
  EXPECT_FALSE(send_once(ends[0], "hello", 5));
  EXPECT_EQ(errno, EPIPE);
  close(ends[0]);
}

TEST(SendOnce, CountsAPartAsAFailure) {
  int ends[2];
  ASSERT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends), 0);
  ASSERT_TRUE(make_nonblocking(ends[0]));
  const std::string much(std::size_t{16} << 20, 'x');
  EXPECT_FALSE(send_once(ends[0], much.data(), much.size()));
  for (const int end : ends) close(end);
}

TEST(ShutdownAndClose, IgnoresNoSocketAndNotifiesThePeer) {
  shutdown_and_close(-1);
  int ends[2];
  ASSERT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends), 0);
  const int twin = dup(ends[0]);  // the peer sees the end although another descriptor is still open
  shutdown_and_close(ends[0]);
  EXPECT_EQ(fcntl(ends[0], F_GETFD), -1);
  char nothing = 0;
  EXPECT_EQ(recv(ends[1], &nothing, 1, MSG_DONTWAIT), 0);
  close(twin);
  close(ends[1]);
}

TEST(MakeNonblocking, IsUndoneByMakeBlocking) {
  const Socket socket(made_socket());
  EXPECT_TRUE(make_nonblocking(socket.get()));
  EXPECT_NE(fcntl(socket.get(), F_GETFL) & O_NONBLOCK, 0);
  EXPECT_TRUE(make_blocking(socket.get()));
  EXPECT_EQ(fcntl(socket.get(), F_GETFL) & O_NONBLOCK, 0);
  EXPECT_FALSE(make_nonblocking(-1));
  EXPECT_FALSE(make_blocking(-1));
}

}  // namespace
}  // namespace vexa
