#include "virtual_camera/server/listener.h"

#include <netinet/in.h>
#include <netinet/tcp.h>

#include <utility>
#include <vector>

namespace vexa::camera {
namespace {

// Far above what honest hosts open at once; beyond it new connections are closed at once.
constexpr std::size_t kMaxConnections = 512;

using SegmentSize = asio::detail::socket_option::integer<IPPROTO_TCP, TCP_MAXSEG>;
constexpr int kNetworkSegment = 1448;

}  // namespace

Listener::Listener(std::shared_ptr<CameraState> state, Factory make)
    : state_(std::move(state)), make_(std::move(make)), acceptor_(state_->context), retry_(state_->context) {}

asio::error_code Listener::open(std::uint16_t port) {
  asio::error_code error;
  const asio::ip::address address = asio::ip::make_address(state_->options.address, error);
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
      self->accepted(std::move(socket));
      return self->accept();
    }
    // Out of descriptors: the waiting peers keep their place until some are free again.
    self->retry_.expires_after(std::chrono::milliseconds(100));
    self->retry_.async_wait([self](asio::error_code stopped) {
      if (!stopped && self->acceptor_.is_open()) self->accept();
    });
  });
}

void Listener::accepted(asio::ip::tcp::socket socket) {
  std::vector<std::weak_ptr<Connection>>& connections = state_->connections;
  std::erase_if(connections, [](const std::weak_ptr<Connection>& connection) { return connection.expired(); });
  if (connections.size() >= kMaxConnections) return;
  const std::shared_ptr<Connection> connection = make_(std::move(socket));
  connections.push_back(connection);
  connection->start();
}

}  // namespace vexa::camera
