#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include "tests/support/test_driver.h"

namespace vexa_test {
namespace {

TEST(StopAudioStreaming, WithoutAStreamIsDoneAtOnce) {
  TestDriver driver;
  EXPECT_EQ(driver.StopAudioStreaming(), LIBD_OK);
  EXPECT_EQ(driver.m_AudioSocket, -1);
}

TEST(StopAudioStreaming, ClosesTheStream) {
  int ends[2];
  ASSERT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends), 0);
  TestDriver driver;
  driver.m_AudioSocket = ends[0];
  EXPECT_EQ(driver.StopAudioStreaming(), LIBD_OK);
  EXPECT_EQ(driver.m_AudioSocket, -1);
  char nothing = 0;
  EXPECT_EQ(recv(ends[1], &nothing, 1, MSG_DONTWAIT), 0);
  close(ends[1]);
}

}  // namespace
}  // namespace vexa_test
