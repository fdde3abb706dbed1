// SPDX-License-Identifier: Apache-2.0
// A port by which a person or a test controls what happens around cameras: plain HTTP, on the loopback address alone.
#ifndef VIRTUAL_CAMERA_SERVER_CONTROL_PORT_H_
#define VIRTUAL_CAMERA_SERVER_CONTROL_PORT_H_

#include <asio/error_code.hpp>
#include <asio/ip/tcp.hpp>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <string_view>

#include "virtual_camera/server/listener.h"
#include "virtual_camera/wire/message.h"

namespace asio {
class io_context;
}

namespace vexa::camera {

// The whole answer with this status, such as "404 Not Found". No browser keeps it, nor shows it in another page.
[[nodiscard]] std::string control_answer(std::string_view status, std::string_view type = {},
                                         std::string_view body = {});

// Why a request is refused before anybody answers it; empty: it is not. A browser names the host that its page believes
// to speak to, and whether the request comes from another page; programs such as curl name their own host only.
[[nodiscard]] std::string_view control_refusal(const RequestHead& request);

// Takes one request a connection. It takes no credentials: it listens on the loopback address alone, and refuses what
// pages of other origins ask through a browser. On the loop's thread; held by its owner and its own visits.
class ControlPort : public std::enable_shared_from_this<ControlPort> {
 public:
  // Returns the whole answer to a request.
  using Answerer = std::function<std::string(const RequestHead& request)>;

  // The context outlives it.
  ControlPort(asio::io_context& context, Answerer answerer);

  // Port 0 takes any free one.
  [[nodiscard]] asio::error_code open(std::uint16_t port);
  void close();
  [[nodiscard]] std::uint16_t port() const { return listener_ ? listener_->port() : std::uint16_t{0}; }

 private:
  struct Visit;

  void take(asio::ip::tcp::socket socket);
  [[nodiscard]] std::string answer(const std::string& text) const;

  asio::io_context& context_;
  const Answerer answerer_;
  std::shared_ptr<Listener> listener_;  // null until the first open()
  std::size_t visits_ = 0;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_CONTROL_PORT_H_
