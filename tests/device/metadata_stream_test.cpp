// SPDX-License-Identifier: Apache-2.0
// The polled stream of motion metadata.
#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "tests/device/alarm_driver.h"
#include "tests/support/process_state.h"

namespace vexa_test {
namespace {

class MetadataStream : public testing::Test {
 protected:
  MetadataStream() { camera_.introduce(driver_, 5000); }

  void set_timeout(int timeout) {
    const vexa::Guard guard(driver_.m_ConnectionLock);
    driver_.m_ConnectionInfo.timeout = timeout;
  }
  void say_part(std::string body) {
    body.resize(64, ' ');
    camera_.say("--part\r\nContent-Length: 64\r\n\r\n" + body);
  }
  ELibDReturnCode poll() { return driver_.GetCurrentPosition(frame_); }
  std::vector<int> values() const { return {frame_.window1, frame_.window2, frame_.window3, frame_.window4}; }

  AlarmCamera camera_;
  AlarmDriver driver_;
  SLibDRawMDFrameInfo frame_;
};

TEST_F(MetadataStream, GivesTheValuesOfEachPart) {
  EXPECT_EQ(driver_.StartModRawData(), LIBD_OK);
  EXPECT_EQ(camera_.requests(), std::vector<std::string>{AlarmCamera::kMetadata});
  say_part("Window1=3&Window2=0&Window3=12&Window4=0");
  say_part("Window2=5");
  EXPECT_EQ(poll(), LIBD_OK);
  EXPECT_EQ(values(), (std::vector<int>{3, 0, 12, 0}));
  EXPECT_EQ(poll(), LIBD_OK);
  EXPECT_EQ(values(), (std::vector<int>{3, 5, 12, 0}));
}

TEST_F(MetadataStream, IsNoneBeforeTheStartAndAfterTheStop) {
  EXPECT_EQ(poll(), LIBD_FAILED);
  EXPECT_EQ(driver_.StopModRawData(), LIBD_OK);
  ASSERT_EQ(driver_.StartModRawData(), LIBD_OK);
  say_part("Window1=1");
  EXPECT_EQ(driver_.StopModRawData(), LIBD_OK);
  EXPECT_EQ(poll(), LIBD_FAILED);
  EXPECT_EQ(camera_.closed_streams(1), 1U);
  EXPECT_EQ(values(), (std::vector<int>{0, 0, 0, 0}));
}

TEST_F(MetadataStream, IsClosedBeforeItIsOpenedAgain) {
  ASSERT_EQ(driver_.StartModRawData(), LIBD_OK);
  ASSERT_EQ(driver_.StartModRawData(), LIBD_OK);
  EXPECT_EQ(camera_.closed_streams(1), 1U);
  say_part("Window1=1");
  EXPECT_EQ(poll(), LIBD_OK);
  EXPECT_EQ(driver_.StopModRawData(), LIBD_OK);
  EXPECT_EQ(camera_.closed_streams(2), 2U);
}

TEST_F(MetadataStream, OfARefusingCameraReportsTheLatestError) {
  camera_.set_answer(AlarmCamera::kMetadata, "HTTP/1.0 401 Unauthorized\r\n\r\n");
  EXPECT_EQ(driver_.StartModRawData(), LIBD_UNAUTHORIZED);
  EXPECT_EQ(driver_.m_MdStreamSocket, -1);
  EXPECT_EQ(poll(), LIBD_FAILED);
}

TEST_F(MetadataStream, ThatFallsSilentTimesOutWithoutGrace) {
  ASSERT_EQ(driver_.StartModRawData(), LIBD_OK);
  const struct {
    int quiet;
    ELibDReturnCode result;
  } rows[] = {{0, LIBD_NO_FRAME}, {5, LIBD_NO_FRAME}, {6, LIBD_TIMEOUT}};
  for (const auto& row : rows) {
    alarm_clock_now = 1000 + row.quiet;
    EXPECT_EQ(poll(), row.result) << row.quiet;
  }
  say_part("Window1=1");
  EXPECT_EQ(poll(), LIBD_OK);
  EXPECT_EQ(driver_.m_LastMdDataTime, 1006);
}

TEST_F(MetadataStream, CutInsideAPartFailsWithTheReadersError) {
  ASSERT_EQ(driver_.StartModRawData(), LIBD_OK);
  set_timeout(30);
  camera_.say("--part\r\n\r\nWindow1=1");
  EXPECT_EQ(poll(), LIBD_TIMEOUT);
  EXPECT_EQ(driver_.LatestErrorText(), "Receive timed out");
  camera_.say("--part\r\n\r\nWindow1=1");
  camera_.hang_up();
  EXPECT_EQ(poll(), LIBD_FAILED);
  EXPECT_EQ(values(), (std::vector<int>{0, 0, 0, 0}));
}

TEST_F(MetadataStream, OfAnyBytesLeavesTheRecordAndGoesOn) {
  ASSERT_EQ(driver_.StartModRawData(), LIBD_OK);
  say_part(std::string("\0Window1=9", 10));
  say_part("Window1=&Window2=x&Window3");
  say_part("Window1=99999999999");
  EXPECT_EQ(poll(), LIBD_OK);
  EXPECT_EQ(poll(), LIBD_OK);
  EXPECT_EQ(values(), (std::vector<int>{0, 0, 0, 0}));
  EXPECT_EQ(poll(), LIBD_OK);
  EXPECT_EQ(values(), (std::vector<int>{2147483647, 0, 0, 0}));
}

TEST_F(MetadataStream, IsTheHostsToStopBeforeItDestroysTheDriver) {
  int socket = -1;
  {
    AlarmDriver driver;
    camera_.introduce(driver);
    ASSERT_EQ(driver.StartModRawData(), LIBD_OK);
    socket = driver.m_MdStreamSocket;
  }
  camera_.say("still open");
  char text[11] = {};
  EXPECT_EQ(recv(socket, text, 10, MSG_WAITALL), 10);
  EXPECT_STREQ(text, "still open");
  close(socket);
}

/// A stream that another thread opens between the stop and the opening of a start.
class OvertakenMetadataStart : public AlarmDriver {
 public:
  ELibDReturnCode StopModRawData() override {
    const ELibDReturnCode result = AlarmDriver::StopModRawData();
    if (m_MdStreamSocket == -1) m_MdStreamSocket = dup(other.driver_end());
    return result;
  }

  StreamPair other;
};

TEST(MetadataStreamStart, LosesNoStreamThatAnotherThreadHasOpenedMeanwhile) {
  const std::size_t before = open_descriptors();
  {
    AlarmCamera camera;
    OvertakenMetadataStart driver;
    camera.introduce(driver, 5000);
    EXPECT_EQ(driver.StartModRawData(), LIBD_OK);
    EXPECT_EQ(driver.AlarmDriver::StopModRawData(), LIBD_OK);
    EXPECT_EQ(camera.closed_streams(1), 1U);
  }
  EXPECT_TRUE(eventually([&] { return open_descriptors() == before; })) << open_descriptors() << ' ' << before;
}

}  // namespace
}  // namespace vexa_test
