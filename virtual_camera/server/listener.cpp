// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/listener.h"

#include <netinet/in.h>
#include <netinet/tcp.h>

#include <asio/io_context.hpp>
#include <chrono>
#include <utility>

namespace vexa::camera {
namespace {

using SegmentSize = asio::detail::socket_option::integer<IPPROTO_TCP, TCP_MAXSEG>;
constexpr int kNetworkSegment = 1448;

}  // namespace

Listener::Listener(asio::io_context& context, std::string address, Take take)
    : address_(std::move(address)), take_(std::move(take)), acceptor_(context), retry_(context) {}

asio::error_code Listener::open(std::uint16_t port) {
  asio::error_code error;
  const asio::ip::address address = asio::ip::make_address(address_, error);
  if (error) return error;
  const asio::ip::tcp::endpoint endpoint(address, port_ != 0 ? port_ : port);
  acceptor_.open(endpoint.protocol(), error);
  if (!error) acceptor_.set_option(asio::socket_base::reuse_address(true), error);
  // As on a network: a receiver that has closed its window opens it again only for a whole segment, and loopback's own
  // are as large as a driver's whole buffer.
  if (!error) acceptor_.set_option(SegmentSize(kNetworkSegment), error);
  if (!error) acceptor_.bind(endpoint, error);
  if (!error) acceptor_.listen(asio::socket_base::max_listen_connections, error);
  if (error) {
    close();
    return error;
  }
  port_ = acceptor_.local_endpoint(error).port();
  accept();
  return error;
}

void Listener::close() {
  asio::error_code ignored;
  acceptor_.close(ignored);
  retry_.cancel();
}

void Listener::accept() {
  acceptor_.async_accept([self = shared_from_this()](asio::error_code error, asio::ip::tcp::socket socket) {
    if (!self->acceptor_.is_open()) return;
    if (!error) {
      self->take_(std::move(socket));
      return self->accept();
    }
    // Out of descriptors: the waiting peers keep their place until some are free again.
    self->retry_.expires_after(std::chrono::milliseconds(100));
    self->retry_.async_wait([self](asio::error_code stopped) {
      if (!stopped && self->acceptor_.is_open()) self->accept();
    });
  });
}

}  // namespace vexa::camera
