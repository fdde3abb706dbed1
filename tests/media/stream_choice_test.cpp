#include "vexa/stream_choice.h"

#include <gtest/gtest.h>

#include <string>

#include "tests/media/live_camera.h"
#include "vexa/failure.h"

namespace vexa_test {
namespace {

/// What the camera says of its streams.
void describe_streams(LiveCamera& camera, const std::string& answer) {
  camera->add_request_fault(
      vexa::camera::RequestFault::raw("inq=camera", "HTTP/1.0 200 OK\r\nContent-Type: text/plain\r\n\r\n" + answer));
}

constexpr const char* kTwoStreams =
    "ImageCodec1=jpeg&ImageSize1=1280,720&FrameRate1=25&Quality1=6&ImageCodec2=h264&ImageSize2=640,480&FrameRate2=15&"
    "H264Quality2=5&BitRate2=2000";

TEST(SelectStream, OpensThatStreamAndReadsItInItsCodec) {
  LiveCamera camera(camera_options());
  MediaDriver driver;
  camera.introduce(driver);
  driver.use_live("JPEG");
  describe_streams(camera, kTwoStreams);
  ASSERT_EQ(vexa::SelectStream(driver, 2), LIBD_OK);
  EXPECT_EQ(driver.m_CameraInfo.streamNumber, 2);
  EXPECT_EQ(driver.m_CameraInfo.codecName, "H.264");
  EXPECT_EQ(driver.m_CameraInfo.imageWidth, 640);
  ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  SLibDVideoFrameInfo frame;
  for (int taken = 0; taken < 2;) {
    if (driver.GetCurrentVideoFrame(frame) == LIBD_OK) ++taken;
  }
  EXPECT_EQ(driver.StopVideoStreaming(), LIBD_OK);
  bool opened = false;
  for (const auto& request : camera->journal().snapshot()) {
    EXPECT_EQ(request.bytes.find("camera.cgi?ImageCodec"), std::string::npos) << "a write to the camera";
    opened = opened || request.bytes.find("DESCRIBE rtsp://" + camera->address() + ":554/media/video2 ") == 0;
  }
  EXPECT_TRUE(opened);
}

TEST(SelectStream, RefusesAStreamThatIsNotThereAndChangesNothing) {
  LiveCamera camera(camera_options());
  MediaDriver driver;
  camera.introduce(driver);
  describe_streams(camera, "ImageCodec1=h264&ImageCodec2=off");
  const SLibDCameraInfo before = driver.m_CameraInfo;
  const struct {
    int stream;
    ELibDReturnCode code;
  } rows[] = {
      {0, LIBD_INVALID_ARGUMENT}, {-1, LIBD_INVALID_ARGUMENT}, {2, LIBD_NOT_SUPPORTED}, {3, LIBD_NOT_SUPPORTED}};
  for (const auto& row : rows) {
    EXPECT_EQ(vexa::SelectStream(driver, row.stream), row.code) << row.stream;
    EXPECT_EQ(vexa::LastFailure(driver).code, row.code);
    EXPECT_EQ(vexa::LastFailure(driver).operation, "SelectStream");
    EXPECT_EQ(driver.m_CameraInfo.streamNumber, before.streamNumber);
    EXPECT_EQ(driver.m_CameraInfo.codecName, before.codecName);
  }
}

TEST(SelectStream, TellsTheFailureOfItsInquiry) {
  LiveCamera camera(camera_options());
  MediaDriver driver;
  camera.introduce(driver);
  camera->add_request_fault(vexa::camera::RequestFault::wrong_credentials("inq=camera"));
  EXPECT_EQ(vexa::SelectStream(driver, 1), LIBD_UNAUTHORIZED);
}

}  // namespace
}  // namespace vexa_test
