// SPDX-License-Identifier: Apache-2.0
// What a stream costs from the socket to the host: the driver beside a bare poll and recvfrom loop on the same stream.
//   streaming_e2e [SECONDS [COUNT]]     COUNT measurements (8) of SECONDS (10); ends with 1 when a frame was lost
// Needs port 554 on 127.0.1.x: run as root, or in `unshare -rn` with the loopback up.
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "bench/bare_stream.h"
#include "bench/camera_process.h"
#include "vexa/vexa_common.h"
#include "virtual_camera/codec/rtp_packetiser.h"
#include "virtual_camera/virtual_camera.h"

namespace {

using std::chrono::steady_clock;
using vexa::camera::CameraOptions;
using vexa::camera::PacketisedClip;
using vexa::camera::VirtualCamera;
using vexa_bench::bare_loop;
using vexa_bench::CountingSink;
using vexa_bench::made_clip;
using vexa_bench::open_bare_stream;
using vexa_bench::Usage;
using vexa_bench::usage_now;

constexpr int kHttpPort = 8080;
constexpr std::size_t kSessionsACamera = 8;
constexpr unsigned kPort = 100;  // Mbit/s, what network cameras have
constexpr unsigned kFastPort = 1000;

FILE* report = nullptr;
std::uint64_t lost_frames = 0;

struct Load {
  const char* name;
  std::size_t streams;
  double frames_per_second;
  std::shared_ptr<const PacketisedClip> clip;
  unsigned link_megabits;  // of the camera's port; 0: a picture's datagrams leave 16 at a time
};

std::string camera_address(std::size_t camera) { return "127.0.1." + std::to_string(camera + 1); }
std::string address_of(std::size_t stream) { return camera_address(stream / kSessionsACamera); }

void serve(const Load& load, std::uint64_t pictures, int ready) {
  std::vector<std::unique_ptr<VirtualCamera>> cameras;
  for (std::size_t i = 0; i * kSessionsACamera < load.streams; ++i) {
    CameraOptions options;
    options.address = camera_address(i);
    options.http_port = kHttpPort;
    options.clip = load.clip;
    options.frames_per_second = load.frames_per_second;
    options.pictures = pictures;
    options.link_megabits = load.link_megabits;
    options.sent_log_limit = 0;
    options.hash_packets = false;
    cameras.push_back(std::make_unique<VirtualCamera>(options));
    if (!cameras.back()->start()) return;
  }
  vexa_bench::report_ready(ready);
  for (;;) pause();
}

struct Result {
  double cpu = 0;
  long wakeups = 0;
  double gigabytes = 0;
  std::uint64_t lost = 0;
  double per_gigabyte() const { return cpu / gigabytes; }
};

std::unique_ptr<CVexaCommon> streaming_driver(const std::string& address) {
  auto driver = std::make_unique<CVexaCommon>();
  SLibDConnectionInfo connection;
  connection.streamTransport = 1;
  connection.host = address;
  connection.port = kHttpPort;
  connection.timeout = 5000;
  connection.userName = "admin";
  connection.password = "admin";
  driver->SetCGILogPath("/dev/null");  // the next call opens it
  driver->SetCurrentConnectionInfo(connection);
  SLibDCameraInfo camera;
  camera.codecName = "H.264";
  driver->SetCameraInfo(camera);
  if (driver->StartVideoStreaming() != LIBD_OK) {
    std::fprintf(stderr, "streaming_e2e: no stream from %s\n", address.c_str());
    std::exit(1);
  }
  return driver;
}

/// Takes what waits at the drivers, once in a frame interval as hosts do that show pictures, until all `wanted` frames
/// have come or none do any more.
std::uint64_t take_frames(std::vector<std::unique_ptr<CVexaCommon>>& drivers, CountingSink& sink,
                          std::uint64_t wanted) {
  std::uint64_t frames = 0;
  auto last = steady_clock::now();
  while (frames < wanted && steady_clock::now() - last < std::chrono::seconds(2)) {
    const std::uint64_t seen = frames;
    for (auto& driver : drivers) {
      SLibDVideoFrameInfo frame;
      frame.sink = &sink;
      while (driver->GetCurrentVideoFrame(frame) == LIBD_OK) ++frames;
    }
    if (frames != seen) last = steady_clock::now();
    std::this_thread::sleep_for(std::chrono::milliseconds(40));
  }
  return frames;
}

// Measured from when all streams play: opening them is not the matter here.
Result run_driver(const Load& load, std::uint64_t pictures) {
  const vexa_bench::CameraProcess cameras([&](int ready) { serve(load, pictures, ready); });
  std::vector<std::unique_ptr<CVexaCommon>> drivers;
  for (std::size_t i = 0; i < load.streams; ++i) drivers.push_back(streaming_driver(address_of(i)));
  CountingSink warm_up;
  const std::uint64_t early = take_frames(drivers, warm_up, load.streams);
  const Usage before = usage_now();
  CountingSink sink;
  const std::uint64_t wanted = pictures * load.streams - early;
  const std::uint64_t frames = take_frames(drivers, sink, wanted);
  const Usage after = usage_now();
  Result result;
  result.cpu = after.cpu - before.cpu;
  result.wakeups = after.wakeups - before.wakeups;
  result.gigabytes = static_cast<double>(sink.bytes) / 1e9;
  result.lost = wanted - frames;
  return result;
}

Result run_bare(const Load& load, std::uint64_t pictures) {
  const vexa_bench::CameraProcess cameras([&](int ready) { serve(load, pictures, ready); });
  std::vector<int> media;
  for (std::size_t i = 0; i < load.streams; ++i) media.push_back(open_bare_stream(address_of(i)));
  const Usage before = usage_now();
  std::vector<std::uint64_t> bytes(load.streams, 0);
  std::vector<std::thread> threads;
  for (std::size_t i = 0; i < load.streams; ++i) threads.emplace_back(bare_loop, media[i], pictures, &bytes[i]);
  for (std::thread& thread : threads) thread.join();
  const Usage after = usage_now();
  Result result;
  result.cpu = after.cpu - before.cpu;
  result.wakeups = after.wakeups - before.wakeups;
  for (const std::uint64_t count : bytes) result.gigabytes += static_cast<double>(count) / 1e9;
  return result;
}

void measure(const Load& load, double seconds) {
  const auto pictures = static_cast<std::uint64_t>(seconds * load.frames_per_second);
  const Result bare = run_bare(load, pictures);
  const Result driver = run_driver(load, pictures);
  lost_frames += driver.lost;
  std::fprintf(report, "%-28s %8.2f %8.2f %7.2f %10ld %10ld %8llu\n", load.name, bare.per_gigabyte(),
               driver.per_gigabyte(), driver.per_gigabyte() / bare.per_gigabyte(), bare.wakeups, driver.wakeups,
               static_cast<unsigned long long>(driver.lost));
  std::fflush(report);
}

/// From PLAY's answer to the first frame, beside what the camera took to send it.
void measure_first_frame() {
  CameraOptions options;
  options.address = camera_address(0);
  options.http_port = kHttpPort;
  options.clip_path = VEXA_CLIPS "/hd.h264";
  VirtualCamera camera(options);
  if (!camera.start()) std::exit(1);
  std::vector<double> extra;
  for (int i = 0; i < 10; ++i) {
    camera.sent().clear();
    const auto driver = streaming_driver(camera_address(0));
    const auto played = steady_clock::now();
    CountingSink sink;
    SLibDVideoFrameInfo frame;
    frame.sink = &sink;
    while (driver->GetCurrentVideoFrame(frame) != LIBD_OK) std::this_thread::sleep_for(std::chrono::microseconds(200));
    const auto shown = steady_clock::now();
    auto sent = played;
    for (const auto& packet : camera.sent().snapshot()) {
      if (packet.picture == 0) sent = packet.time;
    }
    extra.push_back(std::chrono::duration<double, std::milli>(shown - sent).count());
  }
  std::sort(extra.begin(), extra.end());
  std::fprintf(report, "first frame after its last packet: median %.1f ms, worst %.1f ms (a frame interval: 40 ms)\n",
               extra[extra.size() / 2], extra.back());
}

}  // namespace

int main(int argc, char** argv) {
  const double seconds = argc > 1 ? std::strtod(argv[1], nullptr) : 10;
  report = vexa_bench::take_standard_output();
  std::fprintf(report, "%-28s %8s %8s %7s %10s %10s %8s\n", "CPU seconds per GB", "bare", "driver", "ratio", "wake-ups",
               "wake-ups", "lost");
  const auto eight = PacketisedClip::load(VEXA_CLIPS "/hd.h264", 1400);
  const auto two = PacketisedClip::load(VEXA_CLIPS "/low2m.h264", 1400);
  if (!eight || !two) return 1;
  const auto large = made_clip(833333);
  const Load loads[] = {
      {"8 Mbit/s, 100 Mbit/s port", 1, 25, eight, kPort},     {"8 Mbit/s, in bursts", 1, 25, eight, 0},
      {"400 Mbit/s, 1 Gbit/s port", 1, 60, large, kFastPort}, {"400 Mbit/s, in bursts", 1, 60, large, 0},
      {"32 of 2 Mbit/s, ports", 32, 25, two, kPort},          {"32 of 2 Mbit/s, in bursts", 32, 25, two, 0},
      {"64 of 2 Mbit/s, ports", 64, 25, two, kPort},          {"64 of 2 Mbit/s, in bursts", 64, 25, two, 0}};
  const std::size_t count = argc > 2 ? std::strtoul(argv[2], nullptr, 10) : std::size(loads);
  for (std::size_t i = 0; i < std::min(count, std::size(loads)); ++i) measure(loads[i], seconds);
  measure_first_frame();
  return lost_frames == 0 ? 0 : 1;
}
