// SPDX-License-Identifier: Apache-2.0
#include "tests/support/scripted_camera.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <stdexcept>
#include <string_view>
#include <utility>

namespace vexa_test {
namespace {

constexpr int kPatience = 20000;  // milliseconds for what must come; far more than any machine needs

sockaddr_in address_of(const std::string& host, int port) {
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_port = htons(static_cast<std::uint16_t>(port));
  inet_pton(AF_INET, host.c_str(), &address.sin_addr);
  return address;
}

/// A socket bound to a free port of `host`, and the port.
int bound_socket(const std::string& host, int& port) {
  const int made = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
  sockaddr_in address = address_of(host, 0);
  socklen_t length = sizeof address;
  if (made < 0 || bind(made, reinterpret_cast<sockaddr*>(&address), length) != 0 ||
      getsockname(made, reinterpret_cast<sockaddr*>(&address), &length) != 0) {
    throw std::runtime_error("no port for a test");
  }
  port = ntohs(address.sin_port);
  return made;
}

void replace_all(std::string& text, std::string_view from, const std::string& to) {
  for (std::size_t at = 0; (at = text.find(from, at)) != std::string::npos; at += to.size()) {
    text.replace(at, from.size(), to);
  }
}

/// Two neighbouring ports after "client_port=" become "{udp}-{udp+1}".
std::string with_ports_named(std::string text) {
  constexpr std::string_view kKey = "client_port=";
  const std::size_t begin = text.find(kKey);
  if (begin == std::string::npos) return text;
  const auto is_digit = [](char c) { return std::isdigit(static_cast<unsigned char>(c)) != 0; };
  const auto first = text.begin() + static_cast<std::ptrdiff_t>(begin + kKey.size());
  const auto dash = std::find_if_not(first, text.end(), is_digit);
  if (dash == text.end() || *dash != '-' || dash == first) return text;
  const auto end = std::find_if_not(dash + 1, text.end(), is_digit);
  if (end == dash + 1 || std::stol(std::string(dash + 1, end)) != std::stol(std::string(first, dash)) + 1) return text;
  return text.replace(first, end, "{udp}-{udp+1}");
}

}  // namespace

ScriptedCamera::ScriptedCamera(Script script) : script_(std::move(script)), host_(own_loopback(0)) {
  listener_ = bound_socket(host_, port_);
  if (listen(listener_, 16) != 0 || pipe2(stop_, O_CLOEXEC) != 0) throw std::runtime_error("no listener for a test");
  thread_ = std::thread([this] { play(); });
}

ScriptedCamera::~ScriptedCamera() { finish(); }

std::string ScriptedCamera::finish() {
  if (!thread_.joinable()) return complaints_;
  close(stop_[1]);
  thread_.join();
  close(stop_[0]);
  close(listener_);
  return complaints_;
}

void ScriptedCamera::play() {
  for (std::size_t step = 0; step < script_.size();) {
    if (!play_connection(step)) return;
  }
  played_ = true;
}

bool ScriptedCamera::play_connection(std::size_t& step) {
  if (!wait_for(listener_, kPatience)) {
    complaints_ += "nobody connected for step " + std::to_string(step) + "\n";
    return false;
  }
  const int connection = accept4(listener_, nullptr, nullptr, SOCK_CLOEXEC);
  const int at_once = 1;
  setsockopt(connection, IPPROTO_TCP, TCP_NODELAY, &at_once, sizeof at_once);
  Then then = Then::kClose;
  do {
    if (!hear(connection, filled_in(script_[step].expected))) {
      close(connection);
      return false;
    }
    if (script_[step].meanwhile) script_[step].meanwhile();
    say(connection, script_[step]);
    then = script_[step].then;
    ++step;
  } while (step < script_.size() && !script_[step].new_connection);
  end_connection(connection, then);
  return true;
}

bool ScriptedCamera::hear(int connection, const std::string& expected) {
  std::string heard;
  while (with_ports_named(heard).size() < expected.size()) {
    char piece[4096];
    const ssize_t got = wait_for(connection, kPatience) ? recv(connection, piece, sizeof piece, 0) : -1;
    if (got <= 0) break;
    heard.append(piece, static_cast<std::size_t>(got));
  }
  if (with_ports_named(heard) == expected) return true;
  complaints_ += "expected <" + expected + ">, heard <" + heard + ">\n";
  return false;
}

void ScriptedCamera::say(int connection, const ScriptStep& step) {
  const std::string& bytes = step.answer;
  const std::size_t piece = step.piece == 0 ? bytes.size() : step.piece;
  for (std::size_t at = 0; at < bytes.size(); at += piece) {
    if (at != 0 && step.pause > 0 && wait_for(-1, step.pause)) return;
    // The driver may have gone already; what it makes of the answer is the test's to judge.
    if (send(connection, bytes.data() + at, std::min(piece, bytes.size() - at), MSG_NOSIGNAL) < 0) return;
  }
}

void ScriptedCamera::end_connection(int connection, Then then) {
  if (then == Then::kReset) {
    const linger torn{1, 0};
    setsockopt(connection, SOL_SOCKET, SO_LINGER, &torn, sizeof torn);
    close(connection);
    return;
  }
  if (then == Then::kClose) shutdown(connection, SHUT_WR);
  char piece[4096];
  const ssize_t got = wait_for(connection, kPatience) ? recv(connection, piece, sizeof piece, 0) : 0;
  if (got > 0) complaints_ += "not expected: <" + std::string(piece, static_cast<std::size_t>(got)) + ">\n";
  close(connection);
}

/// True when the descriptor becomes readable before the test ends the play.
bool ScriptedCamera::wait_for(int descriptor, int milliseconds) {
  pollfd entries[] = {{descriptor, POLLIN, 0}, {stop_[0], POLLIN, 0}};
  return poll(entries, 2, milliseconds) > 0 && entries[0].revents != 0;
}

std::string ScriptedCamera::filled_in(std::string text) const {
  replace_all(text, "{host}", host_);
  replace_all(text, "{port}", std::to_string(port_));
  return text;
}

FullListener::FullListener() : host_(own_loopback(0)) {
  const int listener = bound_socket(host_, port_);
  sockets_.push_back(listener);
  if (listen(listener, 0) != 0) throw std::runtime_error("no listener for a test");
  const sockaddr_in address = address_of(host_, port_);
  for (;;) {
    const int filler = socket(AF_INET, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0);
    sockets_.push_back(filler);
    connect(filler, reinterpret_cast<const sockaddr*>(&address), sizeof address);
    pollfd entry{filler, POLLOUT, 0};
    if (poll(&entry, 1, 100) == 0) return;
  }
}

FullListener::~FullListener() { vanish(); }

void FullListener::vanish() {
  for (const int socket : std::exchange(sockets_, {})) close(socket);
}

int refusing_port() {
  int port = 0;
  close(bound_socket(own_loopback(0), port));
  return port;
}

}  // namespace vexa_test
