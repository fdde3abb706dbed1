// SPDX-License-Identifier: Apache-2.0
// What a host that waits costs, beside a bare poll and recvfrom loop on the same streams, and how soon it has a frame.
//   waiting_e2e [SECONDS [latency]]   each measurement takes SECONDS (10), or that of latency alone; ends with 1 when a
//                                     frame was lost
//   waiting_e2e --smoke               a short run of each
// Needs port 554 on 127.0.1.x: run as root, or in `unshare -rn` with the loopback up.
#include <sys/epoll.h>
#include <sys/mman.h>

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <map>
#include <thread>

#include "bench/bare_stream.h"
#include "bench/camera_process.h"
#include "vexa/vexa_common.h"
#include "vexa/waiting.h"
#include "virtual_camera/virtual_camera.h"

namespace {

using std::chrono::steady_clock;
using vexa::camera::CameraOptions;
using vexa::camera::PacketisedClip;
using vexa::camera::VirtualCamera;
using vexa_bench::Usage;

constexpr int kHttpPort = 8080;
constexpr std::size_t kSessionsACamera = 8;
constexpr int kEnd = 2000;  // milliseconds without a frame, after which none is expected any more

FILE* report = nullptr;
std::uint64_t lost_frames = 0;

using Clip = std::shared_ptr<const PacketisedClip>;

struct Load {
  const char* name;
  const char* codec;
  std::size_t streams;
  double megabits;  // of a stream
  Clip clip;
  unsigned link_megabits;  // of the camera's port
  bool prompt = false;

  double frames_per_second() const {
    std::size_t bytes = 0;
    for (const std::string& picture : clip->images().pictures()) bytes += picture.size();
    return megabits * 1e6 / 8 / (static_cast<double>(bytes) / static_cast<double>(clip->pictures().size()));
  }
};

/// The clip with pictures as long as a camera of 8 Mbit/s sends them, 25 a second: bytes that no decoder sees are put
/// in front of each picture's last ones. `name` ends in the clip's kind.
Clip stretched(const Clip& clip, const std::string& name, std::size_t last_bytes) {
  constexpr std::size_t kPicture = 40000;
  const std::string path = std::filesystem::temp_directory_path() / (std::to_string(getpid()) + name);
  std::ofstream file(path, std::ios::binary);
  for (std::string picture : clip->images().pictures()) {
    if (picture.size() < kPicture) picture.insert(picture.size() - last_bytes, kPicture - picture.size(), 'U');
    file << picture;
  }
  file.close();
  Clip made = PacketisedClip::load(path, 1400);
  std::filesystem::remove(path);
  return made;
}

std::string camera_address(std::size_t camera) { return "127.0.1." + std::to_string(camera + 1); }
std::string address_of(std::size_t stream) { return camera_address(stream / kSessionsACamera); }

CameraOptions options_of(const Load& load, std::size_t camera, std::uint64_t pictures) {
  CameraOptions options;
  options.address = camera_address(camera);
  options.http_port = kHttpPort;
  options.clip = load.clip;
  options.frames_per_second = load.frames_per_second();
  options.pictures = pictures;
  options.link_megabits = load.link_megabits;
  options.hash_packets = false;
  return options;
}

void serve(const Load& load, std::uint64_t pictures, int ready) {
  std::vector<std::unique_ptr<VirtualCamera>> cameras;
  for (std::size_t i = 0; i * kSessionsACamera < load.streams; ++i) {
    CameraOptions options = options_of(load, i, pictures);
    options.sent_log_limit = 0;
    cameras.push_back(std::make_unique<VirtualCamera>(options));
    if (!cameras.back()->start()) return;
  }
  vexa_bench::report_ready(ready);
  for (;;) pause();
}

/// Where the drivers open their log, which stays empty: in the working folder it would be left behind.
const char* log_in_memory() {
  static const std::string path = "/proc/self/fd/" + std::to_string(memfd_create("requests", MFD_CLOEXEC));
  return path.c_str();
}

std::unique_ptr<CVexaCommon> streaming_driver(const Load& load, const std::string& address) {
  auto driver = std::make_unique<CVexaCommon>();
  driver->SetCGILogPath(log_in_memory());
  SLibDConnectionInfo connection;
  connection.streamTransport = 1;
  connection.host = address;
  connection.port = kHttpPort;
  connection.timeout = 5000;
  connection.userName = "admin";
  connection.password = "admin";
  driver->SetCurrentConnectionInfo(connection);
  SLibDCameraInfo camera;
  camera.codecName = load.codec;
  driver->SetCameraInfo(camera);
  vexa::SetPromptFrames(*driver, load.prompt);
  if (driver->StartVideoStreaming() == LIBD_OK) return driver;
  std::fprintf(stderr, "waiting_e2e: no stream from %s\n", address.c_str());
  std::exit(1);
}

/// The host: one thread that sleeps in epoll until a driver has frames, and takes them all.
class WaitingHost {
 public:
  explicit WaitingHost(const Load& load) : loop_(epoll_create1(EPOLL_CLOEXEC)) {
    for (std::size_t i = 0; i < load.streams; ++i) {
      drivers_.push_back(streaming_driver(load, address_of(i)));
      epoll_event entry = {};
      entry.events = EPOLLIN;
      entry.data.ptr = drivers_.back().get();
      const int descriptor = vexa::VideoFrameDescriptor(*drivers_.back());
      if (descriptor < 0 || epoll_ctl(loop_, EPOLL_CTL_ADD, descriptor, &entry) != 0) std::exit(1);
      take(UINT64_MAX, 0);  // those that play already
    }
  }
  ~WaitingHost() { close(loop_); }
  WaitingHost(const WaitingHost&) = delete;
  WaitingHost& operator=(const WaitingHost&) = delete;

  /// Until `wanted` frames have come in all, or none for `patience` milliseconds.
  void take(std::uint64_t wanted, int patience) {
    while (frames < wanted) {
      epoll_event events[64];
      const int count = epoll_wait(loop_, events, 64, patience);
      if (count <= 0) return;
      for (int i = 0; i < count; ++i) {
        SLibDVideoFrameInfo frame;
        frame.sink = &sink;
        while (static_cast<CVexaCommon*>(events[i].data.ptr)->GetCurrentVideoFrame(frame) == LIBD_OK) ++frames;
      }
    }
  }

  vexa_bench::CountingSink sink;
  std::uint64_t frames = 0;

 private:
  int loop_;
  std::vector<std::unique_ptr<CVexaCommon>> drivers_;
};

struct Cost {
  double cpu = 0;  // seconds a GB
  long wakeups = 0;
};

Cost cost_between(const Usage& before, const Usage& after, std::uint64_t bytes) {
  return {(after.cpu - before.cpu) / (static_cast<double>(bytes) / 1e9), after.wakeups - before.wakeups};
}

Cost run_bare(const Load& load, std::uint64_t pictures) {
  const vexa_bench::CameraProcess cameras([&](int ready) { serve(load, pictures, ready); });
  std::vector<int> media;
  for (std::size_t i = 0; i < load.streams; ++i) media.push_back(vexa_bench::open_bare_stream(address_of(i)));
  const Usage before = vexa_bench::usage_now();
  std::vector<std::uint64_t> bytes(load.streams, 0);
  std::vector<std::thread> threads;
  for (std::size_t i = 0; i < load.streams; ++i)
    threads.emplace_back(vexa_bench::bare_loop, media[i], pictures, &bytes[i]);
  for (std::thread& thread : threads) thread.join();
  const Usage after = vexa_bench::usage_now();
  std::uint64_t all = 0;
  for (const std::uint64_t count : bytes) all += count;
  for (const int socket : media) close(socket);
  return cost_between(before, after, all);
}

// Measured from when all streams play.
void measure(const Load& load, double seconds) {
  const auto pictures = static_cast<std::uint64_t>(std::ceil(seconds * load.frames_per_second())) + 10;
  const Cost bare = run_bare(load, pictures);
  const vexa_bench::CameraProcess cameras([&](int ready) { serve(load, pictures, ready); });
  WaitingHost host(load);
  host.take(load.streams, kEnd);
  const std::uint64_t early_bytes = host.sink.bytes;
  const Usage before = vexa_bench::usage_now();
  host.take(pictures * load.streams, kEnd);
  const std::uint64_t lost = pictures * load.streams - host.frames;
  const Cost waiting = cost_between(before, vexa_bench::usage_now(), host.sink.bytes - early_bytes);
  lost_frames += lost;
  std::fprintf(report, "%-34s %8.2f %8.2f %7.2f %10ld %10ld %8llu\n", load.name, bare.cpu, waiting.cpu,
               waiting.cpu / bare.cpu, bare.wakeups, waiting.wakeups, static_cast<unsigned long long>(lost));
  std::fflush(report);
}

/// From the moment when a picture's last packet was sent to the return of the wait.
void measure_latency(const Load& load, std::size_t frames) {
  VirtualCamera camera(options_of(load, 0, frames));
  if (!camera.start()) std::exit(1);
  const auto driver = streaming_driver(load, camera_address(0));
  std::vector<steady_clock::time_point> woken;
  SLibDVideoFrameInfo frame;
  while (woken.size() < frames && vexa::WaitForVideoFrame(*driver, kEnd)) {
    const auto now = steady_clock::now();
    while (driver->GetCurrentVideoFrame(frame) == LIBD_OK) woken.push_back(now);
  }
  lost_frames += frames - woken.size();
  std::map<std::uint64_t, steady_clock::time_point> sent;
  for (const auto& packet : camera.sent().snapshot()) sent[packet.picture] = packet.time;
  std::vector<double> late;
  for (std::size_t i = 1; i < woken.size(); ++i) {  // a later picture's place is known only if none before is lost
    if (sent.count(i) != 0) late.push_back(std::chrono::duration<double, std::milli>(woken[i] - sent[i]).count());
  }
  if (late.empty() || woken.size() != frames) {
    std::fprintf(report, "%-34s frames were lost\n", load.name);
    return;
  }
  std::sort(late.begin(), late.end());
  std::fprintf(report, "%-34s median %.2f ms, 90%% %.2f ms, worst %.2f ms\n", load.name, late[late.size() / 2],
               late[late.size() * 9 / 10], late.back());
  std::fflush(report);
}

struct Clips {
  Clip hd, two, small, jpeg, mpeg4, large;
};

void measure_costs(const Clips& clips, double seconds, bool smoke) {
  std::fprintf(report, "%-34s %8s %8s %7s %10s %10s %8s\n", "CPU seconds per GB", "bare", "waiting", "ratio",
               "wake-ups", "wake-ups", "lost");
  measure({"H.264, 8 Mbit/s", "H.264", 1, 8, clips.hd, 100}, seconds);
  measure({"H.264, 8 Mbit/s, prompt", "H.264", 1, 8, clips.hd, 100, true}, seconds);
  measure({"MPEG-4, 8 Mbit/s", "MPEG4", 1, 8, clips.mpeg4, 100}, seconds);
  measure({"JPEG, 8 Mbit/s", "JPEG", 1, 8, clips.jpeg, 100}, seconds);
  measure({"H.264, 400 Mbit/s", "H.264", 1, 400, clips.large, 1000}, seconds);
  measure({"32 drivers, 2 Mbit/s", "H.264", 32, 2, clips.two, 100}, seconds);
  if (!smoke) measure({"300 drivers, 0.3 Mbit/s", "H.264", 300, 0.3, clips.small, 100}, seconds);
}

void print_machine() {
  std::ifstream file("/proc/loadavg");
  std::string load;
  std::getline(file, load);
  std::fprintf(report, "%u processors, load %s\n", std::thread::hardware_concurrency(), load.c_str());
}

/// Three hundred streams need more descriptors than a process has by default.
void raise_descriptor_limit() {
  rlimit limit = {};
  getrlimit(RLIMIT_NOFILE, &limit);
  limit.rlim_cur = std::min<rlim_t>(limit.rlim_max, 8192);
  setrlimit(RLIMIT_NOFILE, &limit);
}

}  // namespace

int main(int argc, char** argv) {
  const bool smoke = argc > 1 && std::strcmp(argv[1], "--smoke") == 0;
  const double seconds = smoke ? 0.3 : argc > 1 ? std::strtod(argv[1], nullptr) : 10;
  const bool latency_alone = argc > 2 && std::strcmp(argv[2], "latency") == 0;
  report = vexa_bench::take_standard_output();
  raise_descriptor_limit();
  const Clip hd = PacketisedClip::load(VEXA_CLIPS "/hd.h264", 1400);
  const Clip two = PacketisedClip::load(VEXA_CLIPS "/low2m.h264", 1400);
  const Clip small = PacketisedClip::load(VEXA_CLIPS "/small.h264", 1400);
  Clip jpeg = PacketisedClip::load(VEXA_CLIPS "/plain.mjpeg", 1400);
  Clip mpeg4 = PacketisedClip::load(VEXA_CLIPS "/small.m4v", 1400);
  if (!hd || !two || !small || !jpeg || !mpeg4) return 1;
  constexpr std::size_t kEndOfImage = 2;
  jpeg = stretched(jpeg, ".mjpeg", kEndOfImage);
  mpeg4 = stretched(mpeg4, ".m4v", 0);
  if (!jpeg || !mpeg4) return 1;
  const Clip large = vexa_bench::made_clip(833333);
  print_machine();
  if (!latency_alone) measure_costs({hd, two, small, jpeg, mpeg4, large}, seconds, smoke);
  std::fprintf(report, "from a frame's last packet to the waiting host\n");
  const auto frames = static_cast<std::size_t>(std::ceil(seconds * 25));
  measure_latency({"H.264, 8 Mbit/s", "H.264", 1, 8, hd, 100}, frames);
  measure_latency({"H.264, 8 Mbit/s, prompt", "H.264", 1, 8, hd, 100, true}, frames);
  print_machine();
  return lost_frames == 0 ? 0 : 1;
}
