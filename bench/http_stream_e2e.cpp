// SPDX-License-Identifier: Apache-2.0
// Multipart JPEG over HTTP: CPU seconds a GB beside a bare recv loop, and whether cameras of 30 pictures a second of
// 1 MB each keep up. The camera is a process of its own, so that only the reader's time is counted.
//
//   http_stream_e2e [GIGABYTES [SECONDS]]
#include <arpa/inet.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <signal.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <random>
#include <string>
#include <thread>
#include <vector>

#include "vexa/vexa_common.h"

namespace {

using Clock = std::chrono::steady_clock;

constexpr std::size_t kPicture = 1'000'000;
constexpr int kPicturesASecond = 30;
constexpr int kTimeout = 5000;          // milliseconds
constexpr int kReceiveBuffer = 131072;  // as the driver's
constexpr int kSegment = 1448;
constexpr double kGigabyte = 1e9;

double cpu_seconds() {
  rusage usage{};
  getrusage(RUSAGE_SELF, &usage);
  const auto seconds = [](const timeval& time) {
    return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_usec) / 1e6;
  };
  return seconds(usage.ru_utime) + seconds(usage.ru_stime);
}

std::string part() {
  std::string picture(kPicture, '\0');
  std::mt19937 random(7);  // NOLINT(cert-msc51-cpp): the same bytes in every run
  for (char& byte : picture) byte = static_cast<char>(random());
  return "--part\r\nContent-Type: image/jpeg\r\nDataLen: " + std::to_string(kPicture) + "\r\n\r\n" + picture + "\r\n";
}

bool send_all(int socket, const std::string& bytes) {
  for (std::size_t sent = 0; sent < bytes.size();) {
    const ssize_t count = send(socket, bytes.data() + sent, bytes.size() - sent, MSG_NOSIGNAL);
    if (count <= 0) return false;
    sent += static_cast<std::size_t>(count);
  }
  return true;
}

/// Serves each connection from a process of its own: `pictures` parts, `rate` a second (0: as fast as they go).
class Camera {
 public:
  Camera(std::uint64_t pictures, int rate) : listener_(socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t length = sizeof address;
    // Segments as of a network: loopback's own, of 64 KB, leave the reader's window closed while a header is cut.
    setsockopt(listener_, IPPROTO_TCP, TCP_MAXSEG, &kSegment, sizeof kSegment);
    if (bind(listener_, reinterpret_cast<sockaddr*>(&address), length) != 0 || listen(listener_, 8) != 0) std::abort();
    getsockname(listener_, reinterpret_cast<sockaddr*>(&address), &length);
    port_ = ntohs(address.sin_port);
    process_ = fork();
    if (process_ == 0) serve(pictures, rate);
  }
  ~Camera() {
    kill(process_, SIGKILL);
    waitpid(process_, nullptr, 0);
    close(listener_);
  }
  Camera(const Camera&) = delete;
  Camera& operator=(const Camera&) = delete;

  int port() const { return port_; }

 private:
  [[noreturn]] void serve(std::uint64_t pictures, int rate) const {
    const std::string bytes = part();
    char request[2048];
    const int connection = accept(listener_, nullptr, nullptr);
    if (recv(connection, request, sizeof request, 0) <= 0) _exit(1);
    send_all(connection, "HTTP/1.0 200 OK\r\nContent-Type: multipart/x-mixed-replace\r\n\r\n");
    std::this_thread::sleep_for(std::chrono::milliseconds(100));
    const auto begin = Clock::now();
    for (std::uint64_t i = 0; i < pictures; ++i) {
      if (rate != 0) std::this_thread::sleep_until(begin + i * std::chrono::nanoseconds(1'000'000'000 / rate));
      if (!send_all(connection, bytes)) break;
    }
    pause();
    _exit(0);
  }

  int listener_;
  int port_ = 0;
  pid_t process_ = -1;
};

class Driver : public CVexaCommon {
 public:
  explicit Driver(int port) {
    m_ConnectionInfo.host = "127.0.0.1";
    m_ConnectionInfo.port = port;
    m_ConnectionInfo.timeout = kTimeout;
    m_CameraInfo.codecName = "JPEG";
  }

  /// CPU seconds for `pictures` parts through the reader.
  double read_parts(std::uint64_t pictures) {
    const int socket = http_open("/image1");
    std::vector<char> buffer(kPicture + 200000);
    const double begin = cpu_seconds();
    for (std::uint64_t i = 0; i < pictures;) {
      const int length = http_multipart_jpeg_recv(socket, buffer.data(), static_cast<int>(buffer.size()), kTimeout);
      if (length < 0) std::abort();
      if (length > 0) ++i;
    }
    const double spent = cpu_seconds() - begin;
    http_close(socket);
    return spent;
  }
};

/// CPU seconds for as many bytes through recv alone, into a buffer of a picture's size.
double read_bare(int port, std::uint64_t pictures) {
  const int connection = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
  setsockopt(connection, SOL_SOCKET, SO_RCVBUF, &kReceiveBuffer, sizeof kReceiveBuffer);
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_port = htons(static_cast<std::uint16_t>(port));
  address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  if (connect(connection, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0) std::abort();
  send_all(connection, "GET / HTTP/1.0\r\n\r\n");
  std::vector<char> buffer(kPicture + 200000);
  std::uint64_t missing = pictures * kPicture;
  std::size_t filled = 0;
  const double begin = cpu_seconds();
  while (missing > 0) {
    const ssize_t count = recv(connection, buffer.data() + filled, kPicture - filled, 0);
    if (count <= 0) std::abort();
    filled = (filled + static_cast<std::size_t>(count)) % kPicture;
    missing -= std::min<std::uint64_t>(missing, static_cast<std::uint64_t>(count));
  }
  const double spent = cpu_seconds() - begin;
  close(connection);
  return spent;
}

class Counter : public CDataSink {
 public:
  void Write(const unsigned char*, unsigned int length) override {
    if (length == kPicture) ++whole;
  }
  std::uint64_t whole = 0;
};

/// Streams from `count` cameras at once through whole drivers.
void keep_up(std::size_t count, int seconds) {
  const auto pictures = static_cast<std::uint64_t>(seconds) * kPicturesASecond;
  std::vector<std::unique_ptr<Camera>> cameras;
  std::vector<std::unique_ptr<Driver>> drivers;
  std::vector<Counter> counters(count);
  for (std::size_t i = 0; i < count; ++i) {
    cameras.push_back(std::make_unique<Camera>(pictures, kPicturesASecond));
    drivers.push_back(std::make_unique<Driver>(cameras.back()->port()));
  }
  const double begin = cpu_seconds();
  for (auto& driver : drivers) driver->StartVideoStreaming();
  const auto end = Clock::now() + std::chrono::seconds(seconds) + std::chrono::seconds(2);
  std::uint64_t got = 0;
  while (got < pictures * count && Clock::now() < end) {
    got = 0;
    for (std::size_t i = 0; i < count; ++i) {
      SLibDVideoFrameInfo frame;
      frame.sink = &counters[i];
      while (drivers[i]->GetCurrentVideoFrame(frame) == LIBD_OK) continue;
      got += counters[i].whole;
    }
    poll(nullptr, 0, 5);
  }
  const double spent = cpu_seconds() - begin;
  for (auto& driver : drivers) driver->StopVideoStreaming();
  std::printf("%zu x 30 pictures/s of 1 MB: %llu of %llu pictures, %.1f %% of one core\n", count,
              static_cast<unsigned long long>(got), static_cast<unsigned long long>(pictures * count),
              100 * spent / seconds);
}

}  // namespace

int main(int argc, char** argv) {
  std::setvbuf(stdout, nullptr, _IOLBF, 0);
  constexpr int kRounds = 3;
  const double gigabytes = argc > 1 ? std::strtod(argv[1], nullptr) : 2;
  const int seconds = argc > 2 ? static_cast<int>(std::strtol(argv[2], nullptr, 10)) : 10;
  const auto pictures = static_cast<std::uint64_t>(gigabytes * kGigabyte / kPicture);
  double bare = 0;
  double reader = 0;
  for (int round = 0; round < kRounds; ++round) {
    const Camera for_recv(pictures, 0);
    const double bare_now = read_bare(for_recv.port(), pictures) / gigabytes;
    const Camera for_reader(pictures, 0);
    const double reader_now = Driver(for_reader.port()).read_parts(pictures) / gigabytes;
    bare = round == 0 ? bare_now : std::min(bare, bare_now);
    reader = round == 0 ? reader_now : std::min(reader, reader_now);
    std::printf("recv alone %.3f, multipart JPEG %.3f CPU s/GB: %.2f times\n", bare_now, reader_now,
                reader_now / bare_now);
  }
  std::printf("least of %d: recv alone %.3f, multipart JPEG %.3f CPU s/GB: %.2f times\n", kRounds, bare, reader,
              reader / bare);
  for (const std::size_t cameras : {std::size_t{1}, std::size_t{4}}) keep_up(cameras, seconds);
  return 0;
}
