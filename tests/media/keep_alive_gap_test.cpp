// A camera that does not answer its keep-alives, while it streams.
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <string>

#include "tests/media/live_camera.h"
#include "vexa/cancel.h"
#include "vexa/trace.h"

namespace vexa_test {
namespace {

using vexa::camera::RequestFault;

constexpr int kNone = -1;
// More than wait for a host that does not take them: the camera stands still then.
constexpr int kManyFrames = 20;

TEST(UnansweredKeepAlive, DoesNotHoldThePicturesUp) {
  LiveCamera camera(camera_options());
  MediaDriver driver;
  camera.introduce(driver);
  camera->add_request_fault(RequestFault::raw("inq=edgestorage", "HTTP/1.0 200 OK\r\n\r\nA=1&EsRTSPRec1Timeout=1"));
  camera->add_request_fault(RequestFault::no_answer("GET_PARAMETER"));
  std::atomic<int> taken{0};
  std::atomic<int> taken_before{kNone};  // the keep-alive that is awaited
  ASSERT_TRUE(vexa::SetTrace(driver, [&](const std::string& line) {
    if (line.rfind("send <GET_PARAMETER", 0) == 0) taken_before = taken.load();
    if (line == "error receiving getparameter") taken_before = kNone;
  }));
  ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  SLibDVideoFrameInfo frame;
  bool went_on = false;
  // A machine under load may need more than a second for so many frames: then there is another keep-alive.
  const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(60);
  while (!went_on && std::chrono::steady_clock::now() < deadline) {
    if (driver.GetCurrentVideoFrame(frame) != LIBD_OK) continue;
    ++taken;
    const int before = taken_before;
    went_on = before != kNone && taken - before >= kManyFrames;
  }
  EXPECT_TRUE(went_on);
  vexa::CancelToken hurry;
  hurry.Cancel();
  vexa::SetCancelToken(driver, hurry);
  EXPECT_EQ(driver.StopVideoStreaming(), LIBD_OK);
}

}  // namespace
}  // namespace vexa_test
