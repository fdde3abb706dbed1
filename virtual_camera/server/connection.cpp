// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/connection.h"

#include <fmt/format.h>

#include <asio/buffer.hpp>
#include <asio/post.hpp>
#include <asio/write.hpp>
#include <utility>

#include "virtual_camera/server/camera_state.h"

namespace vexa::camera {
namespace {

// Longer requests are refused: a driver's longest is 1023 bytes.
constexpr std::size_t kMaxRequest = 8192;
// A held or half-closed connection waits this long for its peer to go.
constexpr std::chrono::seconds kLingerLimit{60};
constexpr std::chrono::seconds kIdleLimit{120};

std::string peer_text(const asio::ip::tcp::socket& socket) {
  asio::error_code error;
  const asio::ip::tcp::endpoint peer = socket.remote_endpoint(error);
  return error ? std::string() : fmt::format("{}:{}", peer.address().to_string(), peer.port());
}

}  // namespace

Connection::Connection(asio::ip::tcp::socket socket, std::shared_ptr<CameraState> state)
    : socket_(std::move(socket)),
      deadline_(socket_.get_executor()),
      pace_(socket_.get_executor()),
      state_(std::move(state)),
      peer_(peer_text(socket_)) {}

void Connection::start() {
  asio::error_code ignored;
  socket_.set_option(asio::ip::tcp::no_delay(true), ignored);
  read();
}

void Connection::reset() {
  asio::error_code ignored;
  socket_.set_option(asio::socket_base::linger(true, 0), ignored);
  close();
}

void Connection::close() {
  if (!open_) return;
  open_ = false;
  deadline_.cancel();
  pace_.cancel();
  asio::error_code ignored;
  socket_.close(ignored);
  ended();
}

void Connection::set_deadline(std::chrono::milliseconds time) {
  deadline_.expires_after(time);
  deadline_.async_wait([self = shared_from_this()](asio::error_code error) {
    // A handler already on its way when the deadline moved comes without an error.
    const bool moved = self->deadline_.expiry() > std::chrono::steady_clock::now();
    if (error || moved || !self->open_) return;
    if (!self->received_.empty()) self->journal(std::move(self->received_), {});
    self->close();
  });
}

// A request begun has one limit for all of it, however its pieces come.
void Connection::wait_for_request() {
  const bool begun = std::exchange(request_begun_, !received_.empty());
  if (request_begun_ && begun) return;
  if (request_begun_) return set_deadline(state_->options.request_time_limit);
  if (!may_idle()) return set_deadline(kIdleLimit);
  deadline_.expires_at(std::chrono::steady_clock::time_point::max());
}

void Connection::read() {
  wait_for_request();
  socket_.async_read_some(asio::buffer(chunk_), [self = shared_from_this()](asio::error_code error, std::size_t size) {
    if (!self->open_) return;
    if (!error) return self->received(size);
    if (!self->received_.empty()) self->journal(std::move(self->received_), {});
    self->close();
  });
}

void Connection::received(std::size_t size) {
  received_.append(chunk_.data(), size);
  take_request();
}

void Connection::take_request() {
  received_.erase(0, passed_over(received_));
  const std::size_t size = request_size(received_);
  if (size == 0 && received_.size() <= kMaxRequest) return read();
  request_begun_ = false;
  std::string request = received_.substr(0, size == 0 ? received_.size() : size);
  received_.erase(0, request.size());
  if (request.size() <= kMaxRequest) return answer_request(std::move(request));
  Answer refusal = refuse({}, "400 Bad Request");
  delivery_ = {std::move(refusal.bytes), {}, {}, DeliveryEnd::kClose};
  refusal.bytes = delivery_.bytes;
  journal(std::move(request), refusal);
  deliver();
}

Answer Connection::decide(const std::optional<RequestFault>& fault, const std::string& request) {
  if (!fault || !replaces_request(fault->action)) return answer(request);
  switch (fault->action) {
    case FaultAction::kStatus:
      return refuse(request, fault->text);
    case FaultAction::kWrongCredentials:
      return refuse(request, "401 Unauthorized");
    case FaultAction::kRaw:
      return {0, fault->text};
    case FaultAction::kNoAnswer:
    case FaultAction::kReset:
    case FaultAction::kReboot:
    case FaultAction::kSlowAnswer:
    case FaultAction::kByteAtATime:
    case FaultAction::kCutAfter:
      break;
  }
  return {};
}

void Connection::answer_request(std::string request) {
  const std::optional<RequestFault> fault = state_->request_faults.take(request);
  const Answer answer = decide(fault, request);
  journal(std::move(request), answer);
  if (fault && fault->action == FaultAction::kReboot) {
    if (state_->requests.reboot) state_->requests.reboot(fault->time);
    return;
  }
  delivery_ = plan_delivery(fault, answer.bytes);
  deliver();
}

void Connection::journal(std::string request, const Answer& answer) {
  state_->journal.add(
      {kind(), std::move(request), peer_, std::chrono::system_clock::now(), answer.status, answer.bytes});
}

void Connection::deliver() {
  delivered_ = 0;
  if (delivery_.delay.count() == 0) return begin_delivery();
  set_deadline(delivery_.delay + kLingerLimit);
  pace_.expires_after(delivery_.delay);
  pace_.async_wait([self = shared_from_this()](asio::error_code error) {
    if (!error && self->open_) self->begin_delivery();
  });
}

void Connection::begin_delivery() {
  set_deadline(kLingerLimit);
  claim_socket([self = shared_from_this()] {
    if (self->open_) self->deliver_rest();
  });
}

void Connection::deliver_rest() {
  set_deadline(kLingerLimit);
  if (delivered_ == delivery_.bytes.size()) return delivered();
  const bool trickle = delivery_.interval.count() != 0;
  const std::size_t count = trickle ? 1 : delivery_.bytes.size() - delivered_;
  asio::async_write(socket_, asio::buffer(delivery_.bytes.data() + delivered_, count),
                    [self = shared_from_this(), trickle](asio::error_code error, std::size_t size) {
                      if (!self->open_) return;
                      if (error) return self->close();
                      self->delivered_ += size;
                      if (!trickle) return self->delivered();
                      self->pace_.expires_after(self->delivery_.interval);
                      self->pace_.async_wait([self](asio::error_code stopped) {
                        if (!stopped && self->open_) self->deliver_rest();
                      });
                    });
}

void Connection::delivered() {
  switch (delivery_.end) {
    case DeliveryEnd::kReset:
      return reset();
    case DeliveryEnd::kClose:
      return linger();
    case DeliveryEnd::kHold:
    case DeliveryEnd::kAsUsual:
      break;
  }
  const bool hold = delivery_.end == DeliveryEnd::kHold;
  const bool torn = hold && !delivery_.bytes.empty();
  if (!torn) release_socket();
  const Next next = hold ? Next::kReadOn : answered();
  if (next == Next::kCloseConnection) return linger();
  if (next == Next::kStream) return begin_stream();
  asio::post(socket_.get_executor(), [self = shared_from_this()] {
    if (self->open_) self->take_request();
  });
}

// Whatever the peer sends from here on is ignored.
void Connection::begin_stream() {
  received_.clear();
  deadline_.expires_at(std::chrono::steady_clock::time_point::max());
  drain();
  stream();
}

void Connection::send_at(std::chrono::steady_clock::time_point time, std::function<std::string()> make) {
  pace_.expires_at(time);
  pace_.async_wait([self = shared_from_this(), make = std::move(make)](asio::error_code stopped) {
    if (stopped || !self->open_) return;
    self->delivery_.bytes = make();
    asio::async_write(self->socket_, asio::buffer(self->delivery_.bytes), [self](asio::error_code error, std::size_t) {
      if (!self->open_) return;
      error ? self->close() : self->stream();
    });
  });
}

void Connection::finish_stream() {
  asio::error_code ignored;
  socket_.shutdown(asio::ip::tcp::socket::shutdown_send, ignored);
  set_deadline(kLingerLimit);
}

// Sends the end of the stream and waits for the peer's: closing with bytes unread would reset the connection and could
// take the answer with it.
void Connection::linger() {
  asio::error_code ignored;
  socket_.shutdown(asio::ip::tcp::socket::shutdown_send, ignored);
  received_.clear();
  set_deadline(kLingerLimit);
  drain();
}

void Connection::drain() {
  socket_.async_read_some(asio::buffer(chunk_), [self = shared_from_this()](asio::error_code error, std::size_t) {
    if (!self->open_) return;
    if (error) return self->close();
    self->drain();
  });
}

}  // namespace vexa::camera
