// SPDX-License-Identifier: Apache-2.0
// One TCP connection to the camera: it reads requests, lets a subclass answer, journals both, and sends the answer the
// way the faults say.
#ifndef VIRTUAL_CAMERA_SERVER_CONNECTION_H_
#define VIRTUAL_CAMERA_SERVER_CONNECTION_H_

#include <array>
#include <asio/ip/tcp.hpp>
#include <asio/steady_timer.hpp>
#include <chrono>
#include <cstddef>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "virtual_camera/server/journal.h"
#include "virtual_camera/server/request_faults.h"
#include "virtual_camera/wire/message.h"

namespace vexa::camera {

struct CameraState;

// Held by its own pending reads and writes, and gone once there are none; on the loop's thread. It never blocks:
// deadlines are timers.
class Connection : public std::enable_shared_from_this<Connection> {
 public:
  Connection(asio::ip::tcp::socket socket, std::shared_ptr<CameraState> state);
  virtual ~Connection() = default;
  Connection(const Connection&) = delete;
  Connection& operator=(const Connection&) = delete;

  void start();
  void reset();                                   // ends the connection at once with a TCP reset
  virtual void take_alarm(const std::string&) {}  // the part of a change around the camera

 protected:
  enum class Next { kCloseConnection, kReadOn, kStream };

  virtual RequestKind kind() const = 0;
  // Bytes of the first whole request received; 0 when more must come.
  virtual std::size_t request_size(std::string_view received) const = 0;
  virtual Answer answer(const std::string& request) = 0;
  // The answer that only carries this status.
  virtual Answer refuse(const std::string& request, std::string_view status) const = 0;
  virtual Next answered() = 0;        // the answer has left whole
  virtual bool may_idle() const = 0;  // whether the peer may stay silent between requests
  virtual void ended() {}             // the connection is gone; called once
  // Bytes in front of the next request that are none of it.
  virtual std::size_t passed_over(std::string_view) const { return 0; }
  // Other things leave by the socket too: calls `ready` once an answer may, and they wait until it is released.
  virtual void claim_socket(const std::function<void()>& ready) { ready(); }
  virtual void release_socket() {}
  // After Next::kStream: calls send_at, which calls it again once the bytes have left, or finish_stream.
  virtual void stream() {}

  // `make` is called at that time, unless the connection has ended by then.
  void send_at(std::chrono::steady_clock::time_point time, std::function<std::string()> make);
  void finish_stream();  // ends the stream and waits for the peer to go

  CameraState& state() const { return *state_; }
  const std::shared_ptr<CameraState>& shared_state() const { return state_; }
  asio::ip::tcp::socket& socket() { return socket_; }

 private:
  void read();
  void received(std::size_t size);
  void take_request();
  void answer_request(std::string request);
  Answer decide(const std::optional<RequestFault>& fault, const std::string& request);
  void journal(std::string request, const Answer& answer);
  void deliver();
  void begin_delivery();
  void deliver_rest();
  void delivered();
  void begin_stream();
  void linger();
  void drain();
  void set_deadline(std::chrono::milliseconds time);
  void wait_for_request();
  void close();

  asio::ip::tcp::socket socket_;
  asio::steady_timer deadline_;
  asio::steady_timer pace_;
  std::shared_ptr<CameraState> state_;
  std::string peer_;
  std::array<char, 4096> chunk_{};
  std::string received_;
  Delivery delivery_;
  std::size_t delivered_ = 0;
  bool request_begun_ = false;
  bool open_ = true;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_CONNECTION_H_
