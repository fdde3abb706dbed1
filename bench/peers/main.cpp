// SPDX-License-Identifier: Apache-2.0
// One measurement of one reader of RTP streams: prints a JSON object. scripts/bench_peers compares them.
//   vexa-peers [NAME=VALUE...]   the names and their defaults stand in bench/peers/options.h
// Needs port 554 on 127.0.1.1: scripts/own_network vexa-peers ...
#include <fcntl.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <map>
#include <string>

#include "bench/peers/made_stream.h"
#include "bench/peers/media_server.h"
#include "bench/peers/peer.h"

namespace vexa_peers {

void Received::take(const unsigned char* data, std::size_t length) {
  ++frames;
  bytes += length;
  const std::int64_t sent = read_stamp(data, length);
  if (sent == 0) return;
  const std::int64_t now = std::chrono::steady_clock::now().time_since_epoch().count();
  delays.push_back(static_cast<double>(now - sent) / 1e6);
}

void Received::add(const Received& other) {
  frames += other.frames;
  bytes += other.bytes;
  delays.insert(delays.end(), other.delays.begin(), other.delays.end());
}

namespace {

using Clock = std::chrono::steady_clock;

Options options_from(int count, char** arguments) {
  std::map<std::string, std::string> given;
  for (int i = 1; i < count; ++i) {
    const char* equals = std::strchr(arguments[i], '=');
    if (equals == nullptr) {
      std::fprintf(stderr, "peers: NAME=VALUE expected, not %s\n", arguments[i]);
      std::exit(2);
    }
    given[std::string(arguments[i], static_cast<std::size_t>(equals - arguments[i]))] = equals + 1;
  }
  Options options;
  const auto take = [&given](const char* name, auto&& store) {
    const auto found = given.extract(name);
    if (!found.empty()) store(found.mapped());
  };
  const auto number = [](double& place) { return [&place](const std::string& text) { place = std::stod(text); }; };
  const auto word = [](std::string& place) { return [&place](const std::string& text) { place = text; }; };
  take("peer", word(options.peer));
  take("codec", word(options.codec));
  take("megabits", number(options.megabits));
  take("frames_per_second", number(options.frames_per_second));
  take("seconds", number(options.seconds));
  take("streams", [&](const std::string& text) { options.streams = std::stoul(text); });
  take("link_megabits", number(options.link_megabits));
  take("loss", number(options.loss));
  take("seed", [&](const std::string& text) { options.seed = static_cast<std::uint32_t>(std::stoul(text)); });
  take("gso", [&](const std::string& text) { options.gso = text == "1"; });
  take("prompt", [&](const std::string& text) { options.prompt = text == "1"; });
  if (given.empty()) return options;
  std::fprintf(stderr, "peers: no setting is named %s\n", given.begin()->first.c_str());
  std::exit(2);
}

/// The media server's process.
class ServerProcess {
 public:
  explicit ServerProcess(const Options& options) {
    int ready[2];
    if (pipe(ready) != 0) std::exit(1);
    process_ = fork();
    if (process_ == 0) serve(options, ready[1]);
    close(ready[1]);
    char byte = 0;
    const bool started = read(ready[0], &byte, 1) == 1;
    close(ready[0]);
    if (!started) std::exit(1);
  }
  ~ServerProcess() {
    kill(process_, SIGKILL);
    waitpid(process_, nullptr, 0);
  }
  ServerProcess(const ServerProcess&) = delete;
  ServerProcess& operator=(const ServerProcess&) = delete;

 private:
  pid_t process_ = -1;
};

std::unique_ptr<Peer> make_peer(const Options& options) {
  if (options.peer == "driver") return make_driver_peer(options);
  if (options.peer == "waking") return make_bare_peer(options, BareLoop::kWaking);
  if (options.peer == "napping") return make_bare_peer(options, BareLoop::kNapping);
  if (options.peer == "draining") return make_bare_peer(options, BareLoop::kDraining);
  if (options.peer == "libavformat") return make_libavformat_peer(options);
  return nullptr;
}

struct Usage {
  double cpu = 0;
  long wakeups = 0;
  Clock::time_point time = Clock::now();
};

Usage usage_now() {
  rusage usage{};
  getrusage(RUSAGE_SELF, &usage);
  const auto seconds = [](timeval time) {
    return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_usec) / 1e6;
  };
  return {seconds(usage.ru_utime) + seconds(usage.ru_stime), usage.ru_nvcsw, Clock::now()};
}

/// A number of /proc/self/status.
long status_of(const char* key) {
  std::ifstream status("/proc/self/status");
  for (std::string line; std::getline(status, line);) {
    if (line.starts_with(key)) return std::strtol(line.c_str() + std::strlen(key) + 1, nullptr, 10);
  }
  return 0;
}

double at_share(std::vector<double>& sorted, double share) {
  if (sorted.empty()) return -1;
  return sorted[static_cast<std::size_t>(share * static_cast<double>(sorted.size() - 1))];
}

double seconds_between(Clock::time_point from, Clock::time_point to) {
  return std::chrono::duration<double>(to - from).count();
}

/// The driver's trace of its requests goes to standard output; the result keeps it to itself.
FILE* keep_standard_output() {
  FILE* result = fdopen(dup(STDOUT_FILENO), "w");
  const int nowhere = open("/dev/null", O_WRONLY | O_CLOEXEC);
  dup2(nowhere, STDOUT_FILENO);
  close(nowhere);
  return result;
}

int measure(const Options& options) {
  FILE* result = keep_standard_output();
  const ServerProcess server(options);
  const std::unique_ptr<Peer> peer = make_peer(options);
  if (peer == nullptr) {
    std::fprintf(stderr, "peers: %s is not there\n", options.peer.c_str());
    return 2;
  }
  const long memory_before = status_of("VmRSS:");
  const auto begin = Clock::now();
  if (!peer->start()) {
    std::fprintf(stderr, "peers: %s got no stream\n", options.peer.c_str());
    return 1;
  }
  const Usage before = usage_now();
  Received received = peer->run();
  const Usage after = usage_now();
  const long threads = status_of("Threads:");
  const long memory = status_of("VmRSS:");
  const long addresses = status_of("VmSize:");
  const double first = received.delays.empty() ? -1 : received.delays.front();
  std::sort(received.delays.begin(), received.delays.end());
  const auto stopping = Clock::now();
  peer->stop();
  const auto stopped = Clock::now();
  std::fprintf(result,
               "{\"peer\": \"%s\", \"codec\": \"%s\", \"megabits\": %g, \"frames_per_second\": %g, \"streams\": %zu, "
               "\"link_megabits\": %g, \"loss\": %g, \"gso\": %s, \"word_bits\": %zu, \"frames_sent\": %llu, "
               "\"frames\": %llu, \"bytes\": %llu, \"cpu_seconds\": %.6f, \"wall_seconds\": %.3f, \"wakeups\": %ld, "
               "\"first_frame_ms\": %.3f, \"delay_median_ms\": %.3f, \"delay_99_ms\": %.3f, \"threads\": %ld, "
               "\"resident_kb\": %ld, \"resident_before_kb\": %ld, \"addresses_kb\": %ld, \"start_seconds\": %.3f, "
               "\"stop_seconds\": %.3f}\n",
               options.peer.c_str(), options.codec.c_str(), options.megabits, options.frames_per_second,
               options.streams, options.link_megabits, options.loss, options.gso ? "true" : "false", 8 * sizeof(void*),
               static_cast<unsigned long long>(options.pictures() * options.streams),
               static_cast<unsigned long long>(received.frames), static_cast<unsigned long long>(received.bytes),
               after.cpu - before.cpu, seconds_between(before.time, after.time), after.wakeups - before.wakeups, first,
               at_share(received.delays, 0.5), at_share(received.delays, 0.99), threads, memory, memory_before,
               addresses, seconds_between(begin, before.time), seconds_between(stopping, stopped));
  return std::fclose(result) == 0 && received.frames > 0 ? 0 : 1;
}

}  // namespace
}  // namespace vexa_peers

int main(int argc, char** argv) { return vexa_peers::measure(vexa_peers::options_from(argc, argv)); }
