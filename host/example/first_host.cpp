#include <poll.h>
#include <vexa/models.h>

#include <fstream>
#include <iostream>

struct Recording : CDataSink {  // the host's receiver of frames
  void Write(const unsigned char* data, unsigned int length) override {
    file.write(reinterpret_cast<const char*>(data), length);
    ++frames;
  }
  std::ofstream file{"live.h264", std::ios::binary};
  int frames = 0;
};

int main(int argc, char** argv) {
  const char* address = argc > 1 ? argv[1] : "127.0.0.2";
  SLibDConnectionInfo connection{1 /* RTSP */, address, 80, false, false, "", 0, 5000 /* ms */, "admin", "admin"};
  SLibDCameraInfo video;
  Recording recording;
  SLibDVideoFrameInfo frame{&recording};
  vexa::Profile profile;
  vexa::ProfileError error;
  if (!vexa::LoadProfile("VX-2000", profile, error)) {
    std::cerr << error.Message() << "\n";
    return 3;
  }
  const auto camera = vexa::MakeDevice(profile);  // the driver of this model: it knows what the camera can do
  camera->SetCurrentConnectionInfo(connection);
  if (camera->GetCameraInfo(video) != LIBD_OK) return 1;
  video.bitRate = 4000;  // kbit/s
  if (camera->SetCameraInfo(video) != LIBD_OK || camera->StartVideoStreaming() != LIBD_OK) return 1;
  while (recording.frames < 250) {
    if (camera->GetCurrentVideoFrame(frame) == LIBD_TIMEOUT) return 2;  // the camera has fallen silent
    poll(nullptr, 0, 3);                                                // milliseconds
  }
  return camera->StopVideoStreaming() == LIBD_OK ? 0 : 1;
}
