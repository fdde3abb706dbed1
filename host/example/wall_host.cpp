// SPDX-License-Identifier: Apache-2.0
// Many cameras, one thread: takes their frames as a video wall does, by one epoll.
//   wall-host FRAMES ADDRESS...   one camera for each address, FRAMES of each; ends with 1 when one fell short
#include <sys/epoll.h>
#include <sys/mman.h>
#include <unistd.h>
#include <vexa/vexa_common.h>
#include <vexa/waiting.h>

#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <iostream>
#include <memory>
#include <string>
#include <system_error>
#include <vector>

namespace {

// One picture of the wall. A real host decodes what Write brings, in another thread: a sink copies and returns.
class Tile final : public CDataSink {
 public:
  Tile(const std::string& address, long wanted) : address_(address), wanted_(wanted) {}

  void Write(const unsigned char*, unsigned int length) override {
    bytes_ += length;
    ++frames_;
  }

  bool start() {
    // The driver opens its log of requests with every connection: Log.txt, unless it is named. Here it is in memory.
    const int log = memfd_create("requests", MFD_CLOEXEC);
    camera_.SetCGILogPath(("/proc/self/fd/" + std::to_string(log)).c_str());
    SLibDConnectionInfo connection;
    connection.host = address_;
    connection.port = 80;
    connection.streamTransport = 1;  // video by RTSP
    connection.timeout = 5000;       // milliseconds
    connection.userName = "admin";
    connection.password = "admin";
    camera_.SetCurrentConnectionInfo(connection);
    close(log);  // the driver has a descriptor of its own
    SLibDCameraInfo video;
    ELibDReturnCode code = camera_.GetCameraInfo(video);
    if (code == LIBD_OK) code = camera_.StartVideoStreaming();
    if (code != LIBD_OK) report("cannot open the video", code);
    return code == LIBD_OK;
  }

  // Takes all that is there; false when no more is to be waited for.
  bool take() {
    SLibDVideoFrameInfo frame;
    frame.sink = this;
    ELibDReturnCode code = LIBD_OK;
    while (frames_ < wanted_ && code == LIBD_OK) code = camera_.GetCurrentVideoFrame(frame);
    if (code == LIBD_OK) return false;
    if (code == LIBD_NO_FRAME) return true;
    report("the camera has fallen silent", code);
    return false;
  }

  int descriptor() { return vexa::VideoFrameDescriptor(camera_); }
  bool is_full() const { return frames_ == wanted_; }
  std::uint64_t bytes() const { return bytes_; }

 private:
  void report(const char* what, ELibDReturnCode code) {
    std::string text;
    camera_.GetLatestErrorText(text);
    std::cerr << address_ << ": " << what << ": " << text << " (code " << code << ")\n";
  }

  CVexaCommon camera_;
  const std::string address_;
  const long wanted_;
  long frames_ = 0;
  std::uint64_t bytes_ = 0;
};

int failed(const char* what) {
  std::cerr << what << ": " << std::generic_category().message(errno) << "\n";
  return 1;
}

}  // namespace

int main(int argc, char** argv) {
  if (argc < 3) {
    std::cerr << "usage: wall-host FRAMES ADDRESS...\n";
    return 2;
  }
  const int loop = epoll_create1(EPOLL_CLOEXEC);
  if (loop < 0) return failed("no epoll");
  std::vector<std::unique_ptr<Tile>> wall;
  std::size_t playing = 0;
  for (int i = 2; i < argc; ++i) {
    wall.push_back(std::make_unique<Tile>(argv[i], std::strtol(argv[1], nullptr, 10)));
    Tile* tile = wall.back().get();
    if (!tile->start()) continue;
    epoll_event entry = {};
    entry.events = EPOLLIN;
    entry.data.ptr = tile;
    if (epoll_ctl(loop, EPOLL_CTL_ADD, tile->descriptor(), &entry) != 0) return failed("cannot wait for a camera");
    ++playing;
  }

  while (playing > 0) {
    epoll_event events[16];
    const int count = epoll_wait(loop, events, 16, -1);
    if (count < 0 && errno != EINTR) return failed("cannot wait");
    for (int i = 0; i < count; ++i) {
      auto* tile = static_cast<Tile*>(events[i].data.ptr);
      if (tile->take()) continue;
      epoll_ctl(loop, EPOLL_CTL_DEL, tile->descriptor(), nullptr);
      --playing;
    }
  }

  int full = 0;
  std::uint64_t bytes = 0;
  for (const auto& tile : wall) {
    full += tile->is_full() ? 1 : 0;
    bytes += tile->bytes();
  }
  close(loop);
  std::cerr << full << " of " << wall.size() << " cameras, " << bytes << " bytes\n";
  return full == static_cast<int>(wall.size()) ? 0 : 1;
}
