// SPDX-License-Identifier: Apache-2.0
#include "host/doctor/network_checks.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <fmt/format.h>
#include <ifaddrs.h>
#include <netdb.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <memory>
#include <optional>
#include <string_view>
#include <system_error>

#include "host/base/number_text.h"
#include "host/base/unique_fd.h"

namespace vexa::host {
namespace {

using Clock = std::chrono::steady_clock;
using std::chrono::milliseconds;

constexpr std::size_t kLongestAnswer = 8192;

// The time that a check has.
class Limit {
 public:
  explicit Limit(milliseconds time) : began_(Clock::now()), ends_(began_ + time) {}

  [[nodiscard]] int left() const {
    const auto left = std::chrono::ceil<milliseconds>(ends_ - Clock::now());
    return static_cast<int>(std::max<milliseconds::rep>(left.count(), 0));
  }
  [[nodiscard]] long spent() const {
    return static_cast<long>(std::chrono::duration_cast<milliseconds>(Clock::now() - began_).count());
  }

 private:
  Clock::time_point began_;
  Clock::time_point ends_;
};

struct Found {
  std::optional<sockaddr_in> address;
  std::size_t count = 0;
  std::string error;
};

// Asks the system for the name, and gives up at the limit: a name server may be long in answering.
Found find(const CameraAddress& camera, const Limit& limit) {
  struct Request {
    gaicb entry{};
    addrinfo hints{};
    std::string name;
  };
  const auto release = [](Request* request) {
    // One that goes on is the system's until it ends; it is left to the process's end.
    if (gai_cancel(&request->entry) == EAI_NOTCANCELED) return;
    if (request->entry.ar_result != nullptr) freeaddrinfo(request->entry.ar_result);
    delete request;
  };
  const std::unique_ptr<Request, decltype(release)> request(new Request, release);
  request->name = camera.host;
  request->hints.ai_family = AF_INET;
  request->hints.ai_socktype = SOCK_STREAM;
  request->entry.ar_name = request->name.c_str();
  request->entry.ar_request = &request->hints;
  std::array<gaicb*, 1> list{&request->entry};
  if (const int error = getaddrinfo_a(GAI_NOWAIT, list.data(), 1, nullptr); error != 0)
    return {{}, 0, gai_strerror(error)};
  int error = gai_error(&request->entry);
  for (; error == EAI_INPROGRESS && limit.left() > 0; error = gai_error(&request->entry)) {
    const int left = limit.left();
    const timespec time{left / 1000, (left % 1000) * 1000000L};
    const std::array<const gaicb*, 1> waiting{&request->entry};
    (void)gai_suspend(waiting.data(), 1, &time);
  }
  if (error == EAI_INPROGRESS) return {{}, 0, "no answer from the name server"};
  if (error != 0) return {{}, 0, gai_strerror(error)};
  Found found;
  for (const addrinfo* each = request->entry.ar_result; each != nullptr; each = each->ai_next) {
    if (found.count++ > 0) continue;
    sockaddr_in address{};
    std::memcpy(&address, each->ai_addr, sizeof address);
    address.sin_port = htons(static_cast<std::uint16_t>(camera.port));
    found.address = address;
  }
  return found;
}

struct Connected {
  UniqueFd socket;
  int error = 0;  // the system's number
};

Connected connect_to(const sockaddr_in& address, const Limit& limit) {
  Connected made{UniqueFd(socket(AF_INET, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0))};
  if (!made.socket.valid()) return {UniqueFd(), errno};
  if (connect(made.socket.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) == 0) return made;
  if (errno != EINPROGRESS) return {UniqueFd(), errno};
  pollfd waiting{made.socket.get(), POLLOUT, 0};
  if (poll(&waiting, 1, limit.left()) != 1) return {UniqueFd(), ETIMEDOUT};
  int error = 0;
  socklen_t length = sizeof error;
  getsockopt(made.socket.get(), SOL_SOCKET, SO_ERROR, &error, &length);
  if (error != 0) return {UniqueFd(), error};
  return made;
}

struct Answered {
  std::string head;
  int error = 0;
};

// The head of the answer to a request: up to its empty line, or what came until the limit.
Answered ask(const CameraAddress& camera, std::string_view request, const Limit& limit) {
  const Found found = find(camera, limit);
  if (!found.address) return {{}, EHOSTUNREACH};
  const Connected made = connect_to(*found.address, limit);
  if (!made.socket.valid()) return {{}, made.error};
  if (send(made.socket.get(), request.data(), request.size(), MSG_NOSIGNAL) != static_cast<ssize_t>(request.size())) {
    return {{}, errno};
  }
  Answered answered;
  std::array<char, 1024> piece{};
  while (answered.head.find("\r\n\r\n") == std::string::npos && answered.head.size() < kLongestAnswer) {
    pollfd waiting{made.socket.get(), POLLIN, 0};
    if (poll(&waiting, 1, limit.left()) != 1) return {answered.head, ETIMEDOUT};
    const ssize_t count = recv(made.socket.get(), piece.data(), piece.size(), 0);
    if (count < 0) return {answered.head, errno};
    if (count == 0) break;
    answered.head.append(piece.data(), static_cast<std::size_t>(count));
  }
  return answered;
}

// The number of "HTTP/1.0 401 Unauthorized"; 0 where the answer is no such one.
int status_of(std::string_view head, std::string_view protocol) {
  const std::size_t space = head.find(' ');
  if (!head.starts_with(protocol) || space == std::string_view::npos) return 0;
  return number_text(head.substr(space + 1, 3), 100, 999).value_or(0);
}

std::string error_text(int error) { return std::generic_category().message(error); }

Check named(std::string name) {
  Check check;
  check.name = std::move(name);
  return check;
}

std::string interface_of(const in_addr& own) {
  ifaddrs* list = nullptr;
  if (getifaddrs(&list) != 0) return {};
  const std::unique_ptr<ifaddrs, void (*)(ifaddrs*)> owner(list, freeifaddrs);
  for (const ifaddrs* each = list; each != nullptr; each = each->ifa_next) {
    if (each->ifa_addr == nullptr || each->ifa_addr->sa_family != AF_INET) continue;
    sockaddr_in address{};
    std::memcpy(&address, each->ifa_addr, sizeof address);
    const bool loopback = (ntohl(own.s_addr) >> 24U) == 127 && (ntohl(address.sin_addr.s_addr) >> 24U) == 127;
    if (address.sin_addr.s_addr == own.s_addr || loopback) return each->ifa_name;
  }
  return {};
}

}  // namespace

Check check_camera_name(const CameraAddress& address, milliseconds time) {
  const Limit limit(time);
  Check check = named("name");
  const Found found = find(address, limit);
  check.verdict = found.address ? Verdict::kWorks : Verdict::kFails;
  if (found.address) {
    check.evidence = {{"addresses", found.count}};
  } else {
    check.evidence = {{"error", found.error}};
    check.remedy = "Check the spelling, or give the camera's IPv4 address.";
  }
  check.milliseconds = limit.spent();
  return check;
}

Check check_route(const CameraAddress& address, milliseconds time) {
  const Limit limit(time);
  Check check = named("route");
  const Found found = find(address, limit);
  if (!found.address) return check;
  const UniqueFd socket(::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0));
  sockaddr_in own{};
  socklen_t length = sizeof own;
  const bool routed =
      socket.valid() &&
      connect(socket.get(), reinterpret_cast<const sockaddr*>(&*found.address), sizeof *found.address) == 0 &&
      getsockname(socket.get(), reinterpret_cast<sockaddr*>(&own), &length) == 0;
  const int error = errno;
  check.verdict = routed ? Verdict::kWorks : Verdict::kFails;
  if (routed) {
    check.evidence = {{"interface", interface_of(own.sin_addr)}};
  } else {
    check.evidence = {{"error", error_text(error)}};
    check.remedy = "Check this machine's addresses and routes.";
  }
  check.milliseconds = limit.spent();
  return check;
}

Check check_port(const char* name, const CameraAddress& address, milliseconds time) {
  const Limit limit(time);
  Check check = named(name);
  check.evidence = {{"port", address.port}};
  const Found found = find(address, limit);
  if (!found.address) return check;
  const Connected made = connect_to(*found.address, limit);
  check.verdict = made.socket.valid() ? Verdict::kWorks : Verdict::kFails;
  if (!made.socket.valid()) {
    check.evidence.emplace_back("error", error_text(made.error));
    check.remedy = made.error == ECONNREFUSED
                       ? "Nothing listens there: check the port, and that the camera has started."
                       : "Check power and network, and firewalls on the way.";
  }
  check.milliseconds = limit.spent();
  return check;
}

Check check_http(const CameraAddress& address, milliseconds time) {
  const Limit limit(time);
  Check check = named("http");
  const Answered answered = ask(address, "GET /command/inquiry.cgi?inq=system HTTP/1.0\r\n\r\n", limit);
  const int status = status_of(answered.head, "HTTP/");
  const bool expected = status == 200 || status == 401;
  check.verdict = expected ? Verdict::kWorks : status != 0 ? Verdict::kPartly : Verdict::kFails;
  if (status != 0) {
    check.evidence = {{"status", status}};
  } else {
    check.evidence = {{"error", answered.error != 0 ? error_text(answered.error) : "the answer is not HTTP"}};
  }
  if (!expected) check.remedy = "Check that address and port are a camera's, and that no other server answers there.";
  check.milliseconds = limit.spent();
  return check;
}

Check check_keep_alive(const CameraAddress& rtsp, milliseconds time) {
  const Limit limit(time);
  Check check = named("rtsp keep-alive");
  const std::string request =
      fmt::format("OPTIONS rtsp://{}:{}/media/video1 RTSP/1.0\r\nCSeq: 1\r\n\r\n", rtsp.host, rtsp.port);
  const Answered answered = ask(rtsp, request, limit);
  const int status = status_of(answered.head, "RTSP/");
  const bool offered = answered.head.find("GET_PARAMETER") != std::string::npos;
  if (status == 0) {
    check.verdict = Verdict::kFails;
    check.evidence = {{"error", answered.error != 0 ? error_text(answered.error) : "the answer is not RTSP"}};
    check.remedy = "Check that port 554 is the camera's and can be reached.";
  } else {
    check.verdict = offered ? Verdict::kWorks : Verdict::kPartly;
    check.evidence = {{"status", status}, {"offers", offered ? "GET_PARAMETER" : "no GET_PARAMETER"}};
    if (!offered) check.remedy = "The camera may end sessions early; newer software may offer it.";
  }
  check.milliseconds = limit.spent();
  return check;
}

}  // namespace vexa::host
