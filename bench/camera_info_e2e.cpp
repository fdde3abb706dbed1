// SPDX-License-Identifier: Apache-2.0
// What GetCameraInfo costs of the processor over loopback, beside a bare exchange of the same bytes: buffer, locks,
// reading the answer, and the copy that the host gets.
//   camera_info_e2e [CALLS]     2000 calls of each kind
#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <string>
#include <vector>

#include "bench/camera_process.h"
#include "vexa/vexa_common.h"
#include "virtual_camera/virtual_camera.h"

namespace {

constexpr char kAddress[] = "127.0.2.1";
constexpr int kHttpPort = 8080;
constexpr int kRounds = 5;

[[noreturn]] void serve(int ready) {
  vexa::camera::CameraOptions options;
  options.address = kAddress;
  options.http_port = kHttpPort;
  options.rtsp_port = 0;
  vexa::camera::VirtualCamera camera(options);
  if (!camera.start()) _exit(1);
  vexa_bench::report_ready(ready);
  for (;;) pause();
}

/// Processor time of this thread in microseconds.
double cpu_now() {
  timespec now{};
  clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
  return static_cast<double>(now.tv_sec) * 1e6 + static_cast<double>(now.tv_nsec) / 1e3;
}

class Driver : public CVexaCommon {
 public:
  Driver() {
    m_ConnectionInfo.host = kAddress;
    m_ConnectionInfo.port = kHttpPort;
    m_ConnectionInfo.timeout = 5000;
    m_ConnectionInfo.userName = m_ConnectionInfo.password = "admin";
  }

  /// A property that the camera reports differs from what is stored, so the offer is made anew.
  void forget() { m_CameraInfo = SLibDCameraInfo(); }
};

void demand(bool holds, const char* what) {
  if (holds) return;
  std::fprintf(stderr, "camera_info_e2e: %s\n", what);
  std::exit(1);
}

/// The least that fetches the answer: connect, send, read to the end, close.
void exchange_bare() {
  static const std::string request =
      "GET http://127.0.2.1:8080/command/inquiry.cgi?inq=camera HTTP/1.0\r\n"
      "Authorization: Basic YWRtaW46YWRtaW4=\r\n\r\n";
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_port = htons(kHttpPort);
  inet_pton(AF_INET, kAddress, &address.sin_addr);
  const int connection = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
  demand(connect(connection, reinterpret_cast<sockaddr*>(&address), sizeof address) == 0, "no connection");
  demand(send(connection, request.data(), request.size(), MSG_NOSIGNAL) > 0, "nothing sent");
  char bytes[8192];
  ssize_t total = 0;
  for (ssize_t got = 0; (got = recv(connection, bytes, sizeof bytes, 0)) > 0;) total += got;
  demand(total > 100, "no answer");
  close(connection);
}

template <typename Call>
double microseconds_each(int calls, const Call& call) {
  const double before = cpu_now();
  for (int i = 0; i < calls; ++i) call();
  return (cpu_now() - before) / calls;
}

double median(std::vector<double> values) {
  std::sort(values.begin(), values.end());
  return values[values.size() / 2];
}

}  // namespace

int main(int argc, char** argv) {
  const int calls = argc > 1 ? std::atoi(argv[1]) : 2000;
  const vexa_bench::CameraProcess camera(serve);
  Driver driver;
  SLibDCameraInfo info;
  const auto read = [&] { demand(driver.GetCameraInfo(info) == LIBD_OK, "GetCameraInfo failed"); };
  const auto read_changed = [&] {
    driver.forget();
    read();
  };
  std::vector<double> bare;
  std::vector<double> unchanged;
  std::vector<double> changed;
  for (int round = 0; round < kRounds; ++round) {
    bare.push_back(microseconds_each(calls, exchange_bare));
    unchanged.push_back(microseconds_each(calls, read));
    changed.push_back(microseconds_each(calls, read_changed));
  }
  const double connection = median(bare);
  std::printf("bare exchange               %6.1f us CPU\n", connection);
  std::printf("GetCameraInfo               %6.1f us CPU, %5.1f beside the exchange\n", median(unchanged),
              median(unchanged) - connection);
  std::printf("GetCameraInfo, offer anew   %6.1f us CPU, %5.1f beside the exchange\n", median(changed),
              median(changed) - connection);
  return 0;
}
