#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include "tests/device/settings_exchange.h"

namespace vexa_test {
namespace {

class StopIoStreaming : public testing::Test {
 protected:
  StopIoStreaming() { driver_.m_PendingPins.resize(2); }
  ~StopIoStreaming() override { close(camera_end_); }

  void stream() {
    int ends[2];
    ASSERT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends), 0);
    driver_.m_IoStreamSocket = ends[0];
    camera_end_ = ends[1];
  }

  TestDriver driver_;
  int camera_end_ = -1;
};

TEST_F(StopIoStreaming, WithoutAStreamSendsNothingAndForgetsPendingPins) {
  driver_.use(own_loopback(0), refusing_port(), kPatientTimeout);
  EXPECT_EQ(driver_.StopIoStreaming(), LIBD_OK);
  EXPECT_TRUE(driver_.m_PendingPins.empty());
}

TEST_F(StopIoStreaming, ClosesTheStreamAndSwitchesTheCamerasOff) {
  ScriptedCamera camera({command("/command/system.cgi?AlarmData=off")});
  driver_.use(camera.host(), camera.port(), kPatientTimeout);
  stream();
  EXPECT_EQ(driver_.StopIoStreaming(), LIBD_OK);
  EXPECT_EQ(driver_.m_IoStreamSocket, -1);
  EXPECT_TRUE(driver_.m_PendingPins.empty());
  char nothing = 0;
  EXPECT_EQ(recv(camera_end_, &nothing, 1, MSG_DONTWAIT), 0);
  EXPECT_EQ(camera.finish(), "");
}

TEST_F(StopIoStreaming, GivesTheLatestErrorsCodeAndIsStoppedAllTheSame) {
  ScriptedCamera camera({refusal("/command/system.cgi?AlarmData=off")});
  driver_.use(camera.host(), camera.port(), kPatientTimeout);
  stream();
  EXPECT_EQ(driver_.StopIoStreaming(), LIBD_UNAUTHORIZED);
  EXPECT_EQ(driver_.m_IoStreamSocket, -1);
  EXPECT_EQ(camera.finish(), "");
}

}  // namespace
}  // namespace vexa_test
