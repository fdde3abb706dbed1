// SPDX-License-Identifier: Apache-2.0
// Records live video with the driver alone: no camera profile, one thread, one poll.
//   raw-host ADDRESS FRAMES FILE
#include <poll.h>
#include <sys/mman.h>
#include <unistd.h>
#include <vexa/vexa_common.h>
#include <vexa/waiting.h>

#include <cerrno>
#include <cstdlib>
#include <fstream>
#include <iostream>
#include <string>
#include <system_error>

namespace {

constexpr int kMostStarts = 3;

// Receives each frame while GetCurrentVideoFrame runs.
struct Recording : CDataSink {
  void Write(const unsigned char* data, unsigned int length) override {
    file.write(reinterpret_cast<const char*>(data), length);
    ++frames;
  }
  std::ofstream file;
  long frames = 0;
};

// What a code means for this host.
enum class Next { kGoOn, kWait, kStartAgain, kGiveUp };

Next after(ELibDReturnCode code) {
  switch (code) {
    case LIBD_OK:
      return Next::kGoOn;
    case LIBD_NO_FRAME:  // no error: nothing has come since
      return Next::kWait;
    case LIBD_TIMEOUT:             // the camera does not answer, or its stream has been silent too long
    case LIBD_STREAM_OPEN_FAILED:  // it may have no session left until another client ends
      return Next::kStartAgain;
    case LIBD_FAILED:  // the latest error's text has the reason
    case LIBD_UNAUTHORIZED:
    case LIBD_NOT_SUPPORTED:
    case LIBD_INVALID_ARGUMENT:
    case LIBD_INVALID_MODE:
    case LIBD_FRAME_DAMAGED:     // of the driver's own readers: GetCurrentVideoFrame never returns it
    case LIBD_BUFFER_TOO_SMALL:  // likewise
      return Next::kGiveUp;
  }
  return Next::kGiveUp;
}

int failed(const std::string& what, CVexaCommon& camera, ELibDReturnCode code) {
  std::string text;
  camera.GetLatestErrorText(text);
  std::cerr << what << ": " << text << " (code " << code << ")\n";
  return 1;
}

void introduce(CVexaCommon& camera, const std::string& address) {
  // The driver opens its log of requests with every connection: Log.txt, unless it is named. Here it is in memory.
  const int log = memfd_create("requests", MFD_CLOEXEC);
  camera.SetCGILogPath(("/proc/self/fd/" + std::to_string(log)).c_str());

  SLibDConnectionInfo connection;
  connection.host = address;
  connection.port = 80;            // HTTP
  connection.streamTransport = 1;  // video by RTSP
  connection.timeout = 5000;       // milliseconds
  connection.userName = "admin";
  connection.password = "admin";
  camera.SetCurrentConnectionInfo(connection);
  close(log);  // the driver has a descriptor of its own
}

// The camera's settings as they are, but for the codec.
ELibDReturnCode choose_codec(CVexaCommon& camera, const char* codec) {
  SLibDCameraInfo video;
  const ELibDReturnCode read = camera.GetCameraInfo(video);
  if (read != LIBD_OK) return read;
  video.codecName = codec;
  return camera.SetCameraInfo(video);
}

// Takes frames until there are enough; the stream is open.
ELibDReturnCode record(CVexaCommon& camera, Recording& recording, long frames) {
  pollfd video = {vexa::VideoFrameDescriptor(camera), POLLIN, 0};
  if (video.fd < 0) return LIBD_FAILED;
  SLibDVideoFrameInfo frame;
  frame.sink = &recording;
  while (recording.frames < frames && recording.file) {
    const ELibDReturnCode code = camera.GetCurrentVideoFrame(frame);
    if (after(code) == Next::kGoOn) continue;
    if (after(code) != Next::kWait) return code;
    // Readable for the next frame, and when a silence is to be reported. A host with more to wait for adds it here.
    if (poll(&video, 1, -1) < 0 && errno != EINTR) return LIBD_FAILED;
  }
  return LIBD_OK;
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 4) {
    std::cerr << "usage: raw-host ADDRESS FRAMES FILE\n";
    return 2;
  }
  const long frames = std::strtol(argv[2], nullptr, 10);
  Recording recording;
  recording.file.open(argv[3], std::ios::binary);

  CVexaCommon camera;
  introduce(camera, argv[1]);
  ELibDReturnCode code = choose_codec(camera, "H.264");
  if (code != LIBD_OK) return failed("cannot set the codec", camera, code);

  for (int starts = 1;; ++starts) {
    code = camera.StartVideoStreaming();
    if (code == LIBD_OK) code = record(camera, recording, frames);
    if (after(code) == Next::kGoOn) break;
    if (after(code) != Next::kStartAgain || starts == kMostStarts) return failed("no more video", camera, code);
    failed("start " + std::to_string(starts) + " of " + std::to_string(kMostStarts), camera, code);
  }
  camera.StopVideoStreaming();
  if (!recording.file.flush()) {
    std::cerr << "cannot write " << argv[3] << ": " << std::generic_category().message(errno) << "\n";
    return 1;
  }
  return 0;
}
