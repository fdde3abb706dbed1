#include "vexa/trace.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/media/live_camera.h"
#include "tests/support/failing_new.h"

namespace vexa_test {
namespace {

const std::string kCredentials = "YWRtaW46c2VjcmV0";  // admin:secret

/// What a start and a stop trace, and what they write to standard output.
struct Traced {
  std::vector<std::string> lines;
  std::string printed;
};

Traced start_and_stop(MediaDriver& driver, LiveCamera& camera, bool with_receiver) {
  Traced traced;
  camera.introduce(driver);
  if (with_receiver) {
    EXPECT_TRUE(vexa::SetTrace(driver, [&](const char* line) { traced.lines.emplace_back(line); }));
  }
  testing::internal::CaptureStdout();
  EXPECT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  EXPECT_EQ(driver.StopVideoStreaming(), LIBD_OK);
  traced.printed = testing::internal::GetCapturedStdout();
  return traced;
}

TEST(Trace, OfABareDriverGoesToStandardOutputWithTheCredentials) {
  LiveCamera camera(camera_options());
  MediaDriver driver;
  const Traced traced = start_and_stop(driver, camera, false);
  EXPECT_EQ(traced.printed.rfind("send <DESCRIBE rtsp://", 0), 0u);
  EXPECT_NE(traced.printed.find("Authorization: Basic " + kCredentials), std::string::npos);
}

TEST(Trace, OfAReceiverIsMaskedAndStandardOutputEmpty) {
  LiveCamera camera(camera_options());
  MediaDriver driver;
  const Traced traced = start_and_stop(driver, camera, true);
  EXPECT_EQ(traced.printed, "");
  ASSERT_GE(traced.lines.size(), 4u);
  EXPECT_EQ(
      traced.lines[0],
      "send <DESCRIBE rtsp://" + camera->address() +
          ":554/media/video1 RTSP/1.0\r\nCSeq: 1\r\nAccept: application/sdp\r\nAuthorization: Basic ***\r\n\r\n>");
  EXPECT_EQ(traced.lines.back().rfind("send <TEARDOWN", 0), 0u);
  for (const std::string& line : traced.lines) EXPECT_EQ(line.find(kCredentials), std::string::npos) << line;
}

TEST(Trace, IsTheDefaultAgainAfterAnEmptyReceiver) {
  LiveCamera camera(camera_options());
  MediaDriver driver;
  EXPECT_TRUE(vexa::SetTrace(driver, [](const char*) { ADD_FAILURE(); }));
  EXPECT_TRUE(vexa::SetTrace(driver, nullptr));
  EXPECT_NE(start_and_stop(driver, camera, false).printed, "");
}

TEST(Trace, ShortOfMemoryStaysAsItWas) {
  MediaDriver driver;
  const std::string owned(100, 'x');
  EXPECT_TRUE(vexa::SetTrace(driver, [](const char*) {}));
  std::function<void(const char*)> receiver = [owned](const char*) {};
  const AllocationFailure failure(0);
  EXPECT_FALSE(vexa::SetTrace(driver, std::move(receiver)));
  EXPECT_TRUE(failure.happened());
}

}  // namespace
}  // namespace vexa_test
