// SPDX-License-Identifier: Apache-2.0
// What a camera that never answers its keep-alives costs a stream: pictures lost while each is awaited, at 8 and 40
// Mbit/s, with a keep-alive every second.
//   keep_alive_e2e [SECONDS]     each stream plays SECONDS (10); ends with 1 when a picture was lost
// Needs port 554 on 127.0.1.x: run as root, or in `unshare -rn` with the loopback up.
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "bench/bare_stream.h"
#include "vexa/cancel.h"
#include "vexa/trace.h"
#include "vexa/vexa_common.h"
#include "virtual_camera/virtual_camera.h"

namespace {

using std::chrono::steady_clock;
using vexa::camera::RequestFault;

constexpr int kHttpPort = 8080;
constexpr double kFramesPerSecond = 25;
constexpr const char* kAddress = "127.0.1.1";

/// What a stream of so many pictures came to.
struct Played {
  std::uint64_t pictures = 0;
  std::uint64_t frames = 0;
  int unanswered = 0;
};

std::unique_ptr<vexa::camera::VirtualCamera> silent_camera(std::size_t picture_size, std::uint64_t pictures) {
  vexa::camera::CameraOptions options;
  options.address = kAddress;
  options.http_port = kHttpPort;
  options.clip = vexa_bench::made_clip(picture_size);
  options.frames_per_second = kFramesPerSecond;
  options.pictures = pictures;
  options.link_megabits = 100;
  options.sent_log_limit = 0;
  options.hash_packets = false;
  options.request_faults = {RequestFault::no_answer("GET_PARAMETER"),
                            RequestFault::raw("inq=edgestorage", "HTTP/1.0 200 OK\r\n\r\nA=1&EsRTSPRec1Timeout=1")};
  return std::make_unique<vexa::camera::VirtualCamera>(options);
}

Played play(std::size_t picture_size, double seconds) {
  Played played;
  played.pictures = static_cast<std::uint64_t>(seconds * kFramesPerSecond);
  const auto camera = silent_camera(picture_size, played.pictures);
  CVexaCommon driver;
  SLibDConnectionInfo connection;
  connection.streamTransport = 1;
  connection.host = kAddress;
  connection.port = kHttpPort;
  connection.timeout = 5000;
  connection.userName = connection.password = "admin";
  driver.SetCurrentConnectionInfo(connection);
  SLibDCameraInfo video;
  video.codecName = "H.264";
  vexa::SetTrace(driver, [&](const std::string& line) { played.unanswered += line == "error receiving getparameter"; });
  if (!camera->start() || driver.SetCameraInfo(video) != LIBD_OK || driver.StartVideoStreaming() != LIBD_OK) {
    std::fprintf(stderr, "keep_alive_e2e: no stream: is port 554 free, and are you root?\n");
    std::exit(1);
  }
  auto last = steady_clock::now();
  while (played.frames < played.pictures && steady_clock::now() - last < std::chrono::seconds(2)) {
    SLibDVideoFrameInfo frame;
    while (driver.GetCurrentVideoFrame(frame) == LIBD_OK) {
      ++played.frames;
      last = steady_clock::now();
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(10));
  }
  vexa::CancelToken hurry;
  hurry.Cancel();
  vexa::SetCancelToken(driver, hurry);  // the camera may leave TEARDOWN unanswered too
  driver.StopVideoStreaming();
  return played;
}

}  // namespace

int main(int argc, char** argv) {
  const double seconds = argc > 1 ? std::strtod(argv[1], nullptr) : 10;
  std::uint64_t lost = 0;
  std::printf("%-12s %10s %10s %10s %22s\n", "stream", "pictures", "frames", "lost", "keep-alives given up");
  for (const int megabits : {8, 40}) {
    const auto picture_size = static_cast<std::size_t>(megabits * 1e6 / 8 / kFramesPerSecond);
    const Played played = play(picture_size, seconds);
    lost += played.pictures - played.frames;
    std::printf("%2d Mbit/s    %10llu %10llu %10llu %22d\n", megabits, static_cast<unsigned long long>(played.pictures),
                static_cast<unsigned long long>(played.frames),
                static_cast<unsigned long long>(played.pictures - played.frames), played.unanswered);
  }
  return lost == 0 ? 0 : 1;
}
