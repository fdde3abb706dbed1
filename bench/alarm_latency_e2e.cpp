// SPDX-License-Identifier: Apache-2.0
// How long after a contact closes the status call that reports it returns: one host process watches 16 cameras over
// loopback, each with a thread of its own.
//   alarm_latency_e2e [CHANGES]     200 changes a camera; ends with 1 when one was lost
#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <new>
#include <random>
#include <string>
#include <thread>
#include <vector>

#include "bench/camera_process.h"
#include "vexa/vexa_common.h"
#include "virtual_camera/camera_host.h"

namespace {

using std::chrono::steady_clock;
using Nanoseconds = std::int64_t;

constexpr std::size_t kCameras = 16;
constexpr std::size_t kMostChanges = 2000;
constexpr char kFirstAddress[] = "127.0.3.1";
constexpr int kHttpPort = 8080;
constexpr int kTimeout = 1000;  // milliseconds
constexpr int kQuietReads = 5;

/// What both processes see: the cameras write when each contact changed, the host how many it has seen. The next
/// change of a camera comes when the one before it was seen.
struct Board {
  std::atomic<bool> watching{false};
  std::atomic<std::size_t> seen[kCameras] = {};
  std::atomic<Nanoseconds> changed_at[kCameras][kMostChanges] = {};
};

Nanoseconds clock_now() { return steady_clock::now().time_since_epoch().count(); }

// Some change every millisecond, of a camera that is ready for it.
[[noreturn]] void change_contacts(vexa::camera::CameraHost& cameras, Board& board, std::size_t changes) {
  std::mt19937 random(1);
  std::size_t made[kCameras] = {};
  for (;;) {
    std::this_thread::sleep_for(std::chrono::microseconds(500 + random() % 1000));
    if (!board.watching) continue;
    const std::size_t camera = random() % kCameras;
    std::size_t& count = made[camera];
    if (count == changes || board.seen[camera] != count) continue;
    board.changed_at[camera][count] = clock_now();
    ++count;
    const bool is_taken = cameras.camera(camera).alarms().happen(
        {vexa::camera::AlarmEvent::Kind::kContact, 1, static_cast<int>(count % 2)});
    if (!is_taken) _exit(1);
  }
}

[[noreturn]] void serve(int ready, Board& board, std::size_t changes) {
  vexa::camera::CameraOptions options;
  options.address = kFirstAddress;
  options.http_port = kHttpPort;
  options.rtsp_port = 0;
  vexa::camera::CameraHost cameras(options, kCameras);
  if (!cameras.start()) _exit(1);
  vexa_bench::report_ready(ready);
  change_contacts(cameras, board, changes);
}

class Watcher : public CVexaCommon {
 public:
  explicit Watcher(std::size_t camera) : camera_(camera) {
    m_FixedIoBoxInfo.inputCount = 2;
    m_ConnectionInfo.host = vexa::camera::address_after(kFirstAddress, camera);
    m_ConnectionInfo.port = kHttpPort;
    m_ConnectionInfo.timeout = m_SavedTimeout = kTimeout;
    m_ConnectionInfo.userName = m_ConnectionInfo.password = "admin";
  }

  bool start() {
    std::vector<SLibDPinInfo> pins;
    return StartIoStreaming() == LIBD_OK && GetCurrentIoStatus(pins) == LIBD_OK;
  }

  /// Watches until all changes were seen or the stream has been quiet for long.
  void watch(Board& board, std::size_t changes) {
    std::vector<SLibDPinInfo> pins;
    std::int32_t state = 0;
    for (int quiet = 0; latencies.size() < changes && quiet < kQuietReads;) {
      const ELibDReturnCode read = GetCurrentIoStatus(pins);
      const Nanoseconds now = clock_now();
      if (read != LIBD_OK || pins.empty() || pins[0].state == state) {
        ++quiet;
        continue;
      }
      quiet = 0;
      state = pins[0].state;
      latencies.push_back(static_cast<double>(now - board.changed_at[camera_][latencies.size()]) / 1e6);
      board.seen[camera_] = latencies.size();
    }
    StopIoStreaming();
  }

  std::vector<double> latencies;  // milliseconds

 private:
  const std::size_t camera_;
};

int watch_all(Board& board, std::size_t changes) {
  std::vector<std::unique_ptr<Watcher>> watchers;
  for (std::size_t i = 0; i < kCameras; ++i) {
    watchers.push_back(std::make_unique<Watcher>(i));
    if (watchers.back()->start()) continue;
    std::fprintf(stderr, "alarm_latency_e2e: camera %zu does not stream\n", i);
    return 1;
  }
  board.watching = true;
  std::vector<std::thread> threads;
  for (const auto& watcher : watchers) threads.emplace_back([&] { watcher->watch(board, changes); });
  for (std::thread& thread : threads) thread.join();
  std::vector<double> all;
  for (const auto& watcher : watchers) all.insert(all.end(), watcher->latencies.begin(), watcher->latencies.end());
  std::sort(all.begin(), all.end());
  const auto at = [&all](double share) { return all[static_cast<std::size_t>(share * double(all.size() - 1))]; };
  if (all.empty()) return 1;
  std::printf("%zu cameras, %zu changes of %zu seen: median %.3f ms, 99%% %.3f ms, most %.3f ms\n", kCameras,
              all.size(), kCameras * changes, at(0.5), at(0.99), at(1));
  return all.size() == kCameras * changes ? 0 : 1;
}

}  // namespace

int main(int argc, char** argv) {
  const std::size_t changes = argc > 1 ? std::min<std::size_t>(std::strtoul(argv[1], nullptr, 10), kMostChanges) : 200;
  void* const shared = mmap(nullptr, sizeof(Board), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
  if (shared == MAP_FAILED) return 1;
  Board& board = *new (shared) Board;
  const vexa_bench::CameraProcess cameras([&](int ready) { serve(ready, board, changes); });
  return watch_all(board, changes);
}
