// SPDX-License-Identifier: Apache-2.0
// The HTTP and WebSocket server of vexactl serve: one event loop, no thread a viewer.
#ifndef HOST_SERVE_SERVER_H_
#define HOST_SERVE_SERVER_H_

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "host/base/problem.h"
#include "host/serve/wall.h"

namespace vexa::host {

struct ServerOptions {
  std::string address = "127.0.0.1";
  std::uint16_t port = 0;               // 0: any free one
  std::vector<std::string> names = {};  // that a Host field may state besides this machine's own
  std::string token = {};
  std::string version = {};
  std::size_t most_connections = 256;  // more are closed at once
  std::size_t most_viewers = 64;       // pages and streams; more get 503
  // Called when the first viewer of a camera's H.264 has come, and when the last has gone. On the thread of run().
  std::function<void(std::size_t camera, bool wanted)> want_video = {};
};

// Owned by the command. Everything happens on the thread of run(), stop() excepted. Memory is bounded: a connection has
// at most one request, of 8 KiB and without a body that counts, and one picture on its way; a viewer that takes longer
// for it misses the pictures in between.
class Server {
 public:
  // The wall outlives it.
  Server(ServerOptions options, const Wall& wall);
  ~Server();
  Server(const Server&) = delete;
  Server& operator=(const Server&) = delete;

  // Listens. The port, or why it cannot.
  [[nodiscard]] Result<std::uint16_t> open();
  // Calls `ready` whenever the descriptor is readable.
  void watch(int descriptor, std::function<void()> ready);
  // Serves until stop(), or until `ended`, asked a few times a second, returns true.
  void run(const std::function<bool()>& ended);
  void stop();  // any thread

 private:
  class Impl;
  const std::unique_ptr<Impl> impl_;
};

}  // namespace vexa::host

#endif  // HOST_SERVE_SERVER_H_
