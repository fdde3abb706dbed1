// SPDX-License-Identifier: Apache-2.0
// The latency of a command to move: from the call to the request's last byte at a camera on this machine.
//   ptz_latency_e2e [CALLS]
#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include "vexa/vexa_common.h"

namespace {

using Clock = std::chrono::steady_clock;

/// Takes one request after another, notes when each was accepted and when its last byte was there, and answers 204.
class StampingCamera {
 public:
  struct Stamps {
    Clock::time_point accepted;
    Clock::time_point last_byte;
  };

  explicit StampingCamera(std::size_t requests) : listener_(socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t size = sizeof address;
    auto* place = reinterpret_cast<sockaddr*>(&address);
    good_ =
        bind(listener_, place, size) == 0 && listen(listener_, 16) == 0 && getsockname(listener_, place, &size) == 0;
    port_ = ntohs(address.sin_port);
    stamps_.reserve(requests);
    if (good_) thread_ = std::thread([this, requests] { serve(requests); });
  }
  StampingCamera(const StampingCamera&) = delete;
  StampingCamera& operator=(const StampingCamera&) = delete;
  ~StampingCamera() {
    shutdown(listener_, SHUT_RDWR);
    if (thread_.joinable()) thread_.join();
    close(listener_);
  }

  bool good() const { return good_; }
  int port() const { return port_; }
  /// Waits for the last request.
  const std::vector<Stamps>& stamps() {
    if (thread_.joinable()) thread_.join();
    return stamps_;
  }

 private:
  void serve(std::size_t requests) {
    while (stamps_.size() < requests) {
      const int taken = accept4(listener_, nullptr, nullptr, SOCK_CLOEXEC);
      if (taken < 0) return;
      Stamps stamps{Clock::now(), {}};
      read_request(taken);
      stamps.last_byte = Clock::now();
      stamps_.push_back(stamps);
      constexpr std::string_view kAnswer = "HTTP/1.0 204 No Content\r\n\r\n";
      (void)!send(taken, kAnswer.data(), kAnswer.size(), MSG_NOSIGNAL);
      close(taken);
    }
  }

  static void read_request(int descriptor) {
    std::string request;
    char piece[2048];
    while (request.find("\r\n\r\n") == std::string::npos) {
      const ssize_t size = recv(descriptor, piece, sizeof piece, 0);
      if (size <= 0) return;
      request.append(piece, static_cast<std::size_t>(size));
    }
  }

  int listener_;
  int port_ = 0;
  bool good_ = false;
  std::vector<Stamps> stamps_;
  std::thread thread_;
};

/// A dome that takes moves by direction words.
class Dome : public CVexaCommon {
 public:
  explicit Dome(int port) {
    SLibDFixedPanTiltInfo& turn = m_FixedPTZControlInfo.panTilt;
    turn.panMaxSpeed = turn.tiltMaxSpeed = 24;
    turn.panSpan = 115200;
    turn.panOrigin = -28800;
    turn.tiltSpan = 33600;
    turn.tiltOrigin = -2400;
    m_ConnectionInfo.host = "127.0.0.1";
    m_ConnectionInfo.port = port;
    m_ConnectionInfo.timeout = 5000;
  }
};

struct Times {
  std::vector<double> micros;

  double at(double share) {
    std::sort(micros.begin(), micros.end());
    return micros[static_cast<std::size_t>(share * static_cast<double>(micros.size() - 1))];
  }
};

void print(const char* name, Times times) {
  std::printf("  %-34s median %7.1f us   99%% %7.1f us   worst %8.1f us\n", name, times.at(0.5), times.at(0.99),
              times.at(1));
}

double micros_between(Clock::time_point from, Clock::time_point to) {
  return std::chrono::duration<double, std::micro>(to - from).count();
}

template <typename Call>
bool measure(const char* name, std::size_t calls, Call call) {
  StampingCamera camera(calls);
  if (!camera.good()) return false;
  Dome dome(camera.port());
  std::vector<Clock::time_point> begins;
  for (std::size_t i = 0; i < calls; ++i) {
    begins.push_back(Clock::now());
    if (call(dome, i) != LIBD_OK) return false;
  }
  const std::vector<StampingCamera::Stamps>& stamps = camera.stamps();
  Times whole;
  Times connecting;
  Times sending;
  for (std::size_t i = 0; i < calls; ++i) {
    whole.micros.push_back(micros_between(begins[i], stamps[i].last_byte));
    connecting.micros.push_back(micros_between(begins[i], stamps[i].accepted));
    sending.micros.push_back(micros_between(stamps[i].accepted, stamps[i].last_byte));
  }
  std::printf("%s, %zu calls\n", name, calls);
  print("call to accepted connection", connecting);
  print("accepted connection to last byte", sending);
  print("call to last byte", whole);
  return true;
}

}  // namespace

int main(int argc, char** argv) {
  const std::size_t calls = argc > 1 ? std::max<std::size_t>(1, std::strtoul(argv[1], nullptr, 10)) : 5000;
  const bool good = measure("PanTilt, stop", calls, [](Dome& dome, std::size_t) { return dome.PanTilt(0, 0); }) &&
                    measure("PanTiltAbsolute", calls, [](Dome& dome, std::size_t i) {
                      return dome.PanTiltAbsolute(static_cast<int>(i % 10001), 5000);
                    });
  if (!good) std::fprintf(stderr, "the camera could not be opened, or a call failed\n");
  return good ? 0 : 1;
}
