// SPDX-License-Identifier: Apache-2.0
#include <vexa/models.h>
#include <vexa/trace.h>
#include <vexa/vexa_common.h>
#include <vexa/waiting.h>

#include <fstream>
#include <iostream>
#include <string>

// Receives each frame while GetCurrentVideoFrame runs.
struct Recording : CDataSink {
  void Write(const unsigned char* data, unsigned int length) override {
    file.write(reinterpret_cast<const char*>(data), length);
    ++frames;
  }
  std::ofstream file{"live.h264", std::ios::binary};
  int frames = 0;
};

int failed(const char* what, const std::string& why) {
  std::cerr << what << ": " << why << "\n";
  return 1;
}

// Why the camera's latest operation failed.
std::string reason(CLibraryDevice& camera, ELibDReturnCode code) {
  std::string text;
  camera.GetLatestErrorText(text);
  return text + " (code " + std::to_string(code) + ")";
}

// Takes frames until there are enough; the stream is open.
ELibDReturnCode record(CVexaCommon& camera, Recording& recording, int frames) {
  SLibDVideoFrameInfo frame;
  frame.sink = &recording;
  while (recording.frames < frames && recording.file) {
    const ELibDReturnCode result = camera.GetCurrentVideoFrame(frame);
    // Sleeps until a frame comes or a silence of the camera is to be reported.
    if (result == LIBD_NO_FRAME) vexa::WaitForVideoFrame(camera, -1);
    // LIBD_TIMEOUT: the camera has been silent for longer than the connection's time-out.
    if (result != LIBD_OK && result != LIBD_NO_FRAME) return result;
  }
  return LIBD_OK;
}

int main(int argc, char** argv) {
  SLibDConnectionInfo connection;
  connection.host = argc > 1 ? argv[1] : "127.0.0.2";
  connection.port = 80;            // HTTP
  connection.streamTransport = 1;  // video by RTSP
  connection.timeout = 5000;       // milliseconds
  connection.userName = "admin";
  connection.password = "admin";

  vexa::Profile profile;
  vexa::ProfileError error;
  if (!vexa::LoadProfile("VX-2000", profile, error)) return failed("no profile", error.Message());
  const auto camera = vexa::MakeDevice(profile);  // the driver of this model: it knows what the camera can do
  if (!camera) return failed("no driver", "out of memory");
  camera->SetCurrentConnectionInfo(connection);
  // Without it the driver writes its RTSP requests, password included, to standard output.
  if (auto* driver = dynamic_cast<CVexaCommon*>(camera.get())) vexa::SetTrace(*driver, [](const char*) {});

  SLibDCameraInfo video;
  ELibDReturnCode result = camera->GetCameraInfo(video);
  if (result != LIBD_OK) return failed("cannot read the video settings", reason(*camera, result));
  video.bitRate = 4000;  // kbit/s
  result = camera->SetCameraInfo(video);
  if (result != LIBD_OK) return failed("cannot set the bit rate", reason(*camera, result));

  Recording recording;
  result = camera->StartVideoStreaming();
  if (result != LIBD_OK) return failed("cannot open the video", reason(*camera, result));
  result = record(static_cast<CVexaCommon&>(*camera), recording, 250);  // every driver of MakeDevice is one
  const std::string why = reason(*camera, result);
  camera->StopVideoStreaming();
  if (result != LIBD_OK) return failed("the video has ended early", why);
  if (!recording.file.flush()) return failed("cannot write", "live.h264");
  return 0;
}
