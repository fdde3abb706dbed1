// SPDX-License-Identifier: Apache-2.0
// Many drivers in one process, most of them with a camera that answers anything. How many is decided by the
// environment: VEXA_CROWD_DRIVERS and VEXA_CROWD_STARTS, for scripts/crowd; here few.
#include <fcntl.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <unistd.h>

#include <arpa/inet.h>
#include <algorithm>
#include <atomic>
#include <cstdlib>
#include <deque>
#include <memory>
#include <random>
#include <thread>
#include <vector>

#include "tests/media/live_camera.h"
#include "tests/support/own_address.h"
#include "tests/support/process_state.h"
#include "vexa/trace.h"

namespace vexa_test {
namespace {

std::size_t number_from(const char* variable, std::size_t otherwise) {
  const char* const text = std::getenv(variable);
  return text == nullptr ? otherwise : std::strtoul(text, nullptr, 10);
}

/// Takes all connections at a port of its own, and answers each request with something else.
class HostileCamera {
 public:
  HostileCamera() : host_(own_loopback(9)), random_(1) {
    listener_ = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    inet_pton(AF_INET, host_.c_str(), &address.sin_addr);
    socklen_t length = sizeof address;
    EXPECT_EQ(bind(listener_, reinterpret_cast<const sockaddr*>(&address), length), 0);
    EXPECT_EQ(listen(listener_, SOMAXCONN), 0);
    getsockname(listener_, reinterpret_cast<sockaddr*>(&address), &length);
    port_ = ntohs(address.sin_port);
    thread_ = std::thread([this] { serve(); });
  }
  ~HostileCamera() {
    stop_ = true;
    thread_.join();
    for (const int connection : connections_) close(connection);
    close(listener_);
  }
  HostileCamera(const HostileCamera&) = delete;
  HostileCamera& operator=(const HostileCamera&) = delete;

  const std::string& host() const { return host_; }
  int port() const { return port_; }
  std::uint64_t requests() const { return requests_; }

 private:
  void serve() {
    while (!stop_) {
      std::vector<pollfd> entries = {{listener_, POLLIN, 0}};
      for (const int connection : connections_) entries.push_back({connection, POLLIN, 0});
      if (poll(entries.data(), entries.size(), 20) <= 0) continue;
      const int accepted = accept4(listener_, nullptr, nullptr, SOCK_CLOEXEC | SOCK_NONBLOCK);
      if (accepted >= 0) connections_.push_back(accepted);
      for (std::size_t i = 1; i < entries.size(); ++i) {
        if (entries[i].revents != 0 && !answer(entries[i].fd)) {
          close(entries[i].fd);
          connections_.erase(std::find(connections_.begin(), connections_.end(), entries[i].fd));
        }
      }
    }
  }

  /// False when the connection is over.
  bool answer(int connection) {
    char request[4096];
    if (recv(connection, request, sizeof request, 0) <= 0) return false;
    ++requests_;
    std::string text;
    switch (random_() % 6) {
      case 0:
        return true;  // never
      case 1:
        return false;
      case 2:
        text = "HTTP/1.0 200 OK\r\n\r\n";
        break;
      case 3:
        text = "RTSP/1.0 200 OK\r\nSession: 1\r\n\r\na=rtpmap:96 H264/90000\r\n";
        break;
      case 4:
        text = "HTTP/1.0 200 OK\r\n\r\nImageCodec1=h264&ImageSize1=99999,-1&";
        break;
      default:
        break;
    }
    for (std::size_t bytes = random_() % 3000; bytes > 0; --bytes) text += static_cast<char>(random_());
    return send(connection, text.data(), text.size(), MSG_NOSIGNAL) > 0 && random_() % 2 == 0;
  }

  const std::string host_;
  std::mt19937 random_;
  int port_ = 0;
  int listener_ = -1;
  std::vector<int> connections_;
  std::atomic<bool> stop_{false};
  std::atomic<std::uint64_t> requests_{0};
  std::thread thread_;
};

/// Takes all descriptors below 1024, as far as the system gives any above.
class HighDescriptors {
 public:
  HighDescriptors() {
    rlimit limit{};
    getrlimit(RLIMIT_NOFILE, &limit);
    before_ = limit;
    limit.rlim_cur = limit.rlim_max;
    setrlimit(RLIMIT_NOFILE, &limit);
    constexpr int kFirst = 1024;
    for (int taken = 0; taken < kFirst;) {
      taken = open("/dev/null", O_RDONLY | O_CLOEXEC);
      if (taken < 0) return;
      descriptors_.push_back(taken);
    }
  }
  ~HighDescriptors() {
    for (const int descriptor : descriptors_) close(descriptor);
    setrlimit(RLIMIT_NOFILE, &before_);
  }
  HighDescriptors(const HighDescriptors&) = delete;
  HighDescriptors& operator=(const HighDescriptors&) = delete;

 private:
  rlimit before_{};
  std::vector<int> descriptors_;
};

/// A host of hostile cameras: it starts, polls and stops them, one after the other, until it is told to end.
void use_hostile_cameras(std::deque<MediaDriver>& drivers, std::size_t first, std::size_t step,
                         const std::atomic<bool>& stop) {
  for (std::size_t i = first; !stop; i = i + step < drivers.size() ? i + step : first) {
    MediaDriver& driver = drivers[i];
    driver.StartVideoStreaming();
    SLibDVideoFrameInfo frame;
    driver.GetCurrentVideoFrame(frame);
    SLibDCameraInfo info;
    driver.GetCameraInfo(info);
    driver.StopVideoStreaming();
  }
}

TEST(Crowd, AmongHostileCamerasAnHonestOnesPicturesAllCome) {
  constexpr std::size_t kHosts = 8;
  constexpr std::size_t kPictures = 50;
  const HighDescriptors high;
  HostileCamera hostile;
  LiveCamera camera(camera_options());
  const std::size_t count = std::max<std::size_t>(number_from("VEXA_CROWD_DRIVERS", 16), kHosts);
  std::deque<MediaDriver> drivers;
  for (std::size_t i = 0; i < count; ++i) {
    MediaDriver& driver = drivers.emplace_back();
    vexa::SetTrace(driver, [](const char*) {});
    driver.use(hostile.host(), hostile.port(), 1000);
    if (i % 2 == 0) driver.use_live_h264();
    driver.state().teardown_timeout = 1000;
  }
  std::atomic<bool> stop{false};
  std::vector<std::thread> hosts;
  for (std::size_t i = 0; i < kHosts; ++i) {
    hosts.emplace_back([&, i] { use_hostile_cameras(drivers, i, kHosts, stop); });
  }
  EXPECT_TRUE(eventually([&] { return hostile.requests() >= kHosts; }));
  {
    MediaDriver honest;
    vexa::SetTrace(honest, [](const char*) {});
    camera.play(honest);
    FrameTaker taker;
    const auto frames = taker.take_all(honest, kPictures, std::chrono::seconds(60));
    EXPECT_EQ(frames.size(), kPictures);
    for (std::size_t i = 0; i < frames.size(); ++i) EXPECT_TRUE(camera.sent(i, frames[i].bytes)) << "picture " << i;
    honest.StopVideoStreaming();
  }
  stop = true;
  for (std::thread& host : hosts) host.join();
}

TEST(Crowd, StartsAndStopsLeaveNoDescriptorAndNoThread) {
  LiveCamera camera(camera_options(1));
  MediaDriver driver;
  vexa::SetTrace(driver, [](const char*) {});
  camera.introduce(driver);
  ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  ASSERT_EQ(driver.StopVideoStreaming(), LIBD_OK);
  const std::size_t descriptors = open_descriptors();
  const std::size_t threads = running_threads();
  for (std::size_t i = number_from("VEXA_CROWD_STARTS", 20); i > 0; --i) {
    ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK) << driver.latest_error();
    ASSERT_EQ(driver.StopVideoStreaming(), LIBD_OK) << driver.latest_error();
  }
  EXPECT_TRUE(eventually([&] { return running_threads() <= threads; }));
  // The camera's connections are in this process too, and end when it learns of the driver's.
  EXPECT_TRUE(eventually([&] { return open_descriptors() <= descriptors; }));
}

}  // namespace
}  // namespace vexa_test
