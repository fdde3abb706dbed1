// SPDX-License-Identifier: Apache-2.0
#include "tests/torture/camera_process.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <netinet/in.h>
#include <poll.h>
#include <signal.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <fstream>
#include <string>

#include "tests/torture/scenarios.h"

namespace vexa::torture {
namespace {

constexpr int kHttpPort = 80;
constexpr int kControlPort = 8081;
constexpr int kRecordingTime = 1500;  // milliseconds

// Whether the request is answered with success.
bool get(int port, const std::string& path) {
  const int fd = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_port = htons(static_cast<std::uint16_t>(port));
  inet_pton(AF_INET, kCamera, &address.sin_addr);
  const std::string request = "GET " + path + " HTTP/1.0\r\nAuthorization: Basic YWRtaW46YWRtaW4=\r\n\r\n";
  char answer[12] = {};
  const bool answered = connect(fd, reinterpret_cast<const sockaddr*>(&address), sizeof(address)) == 0 &&
                        send(fd, request.data(), request.size(), MSG_NOSIGNAL) > 0 &&
                        recv(fd, answer, sizeof(answer), MSG_WAITALL) == sizeof(answer);
  close(fd);
  return answered && answer[9] == '2';  // "HTTP/1.0 2xx"
}

// Silence, in the folder that the program runs in.
void write_sound() { std::ofstream("torture.g711_64") << std::string(64000, '\xd5'); }

// The camera records while its network is away.
bool record() {
  const bool storing = get(kHttpPort,
                           "/command/edgestorage.cgi?Edgestorage=on&EsRec1=image1,off&EsAlmRec1Time=0,0&"
                           "EsAlmRec1WatchAddress=10.0.0.1");
  const bool away = get(kControlPort, "/network/unplug");
  poll(nullptr, 0, kRecordingTime);
  return storing && away && get(kControlPort, "/network/plug") &&
         get(kHttpPort, "/command/edgestorage.cgi?Edgestorage=off");
}

}  // namespace

CameraProcess::CameraProcess(const char* program, bool with_recording) {
  int ends[2];
  if (pipe2(ends, O_CLOEXEC) != 0) return;
  write_sound();
  process_ = fork();
  if (process_ == 0) {
    prctl(PR_SET_PDEATHSIG, SIGTERM);
    dup2(ends[1], STDOUT_FILENO);
    execl(program, program, "--address", kCamera, "--profile", VEXA_SOURCE_DIR "/models/profiles/LMX-P200.json",
          "--drawn", "--card", "16", "--sound", "torture", "--control-port", std::to_string(kControlPort).c_str(),
          static_cast<char*>(nullptr));
    _exit(127);
  }
  close(ends[1]);
  char line[256];
  const bool announced = read(ends[0], line, sizeof(line)) > 0;
  close(ends[0]);
  ready_ = announced && get(kHttpPort, "/command/camera.cgi?ImageSize1=320,192") && (!with_recording || record());
}

CameraProcess::~CameraProcess() {
  if (process_ <= 0) return;
  kill(process_, SIGTERM);
  waitpid(process_, nullptr, 0);
}

}  // namespace vexa::torture
