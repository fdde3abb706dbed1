// SPDX-License-Identifier: Apache-2.0
#include "transport/http_exchange.h"

#include <sys/socket.h>

#include "runtime/base/text.h"
#include "runtime/base/wipe.h"
#include "transport/failure.h"
#include "transport/http_receive.h"
#include "transport/tcp_connect.h"
#include "transport/wire/http_answer.h"
#include "transport/wire/http_request.h"

namespace vexa {
namespace {

constexpr int kReceiveBuffer = 131072;
constexpr int kHeaderRoom = 1023;

constexpr int kStatusOk = 200;
constexpr int kStatusNoContent = 204;
constexpr int kStatusUnauthorized = 401;

WaitLimit limit_of(const HttpPeer& peer) { return {peer.connection.timeout, peer.cancels}; }

Result<Socket> connect_http(const HttpPeer& peer) {
  const SLibDConnectionInfo& info = peer.connection;
  const ResolvedHost host = info.useProxy ? resolve_host(info.proxyHost, info.proxyPort, peer.cancels)
                                          : resolve_host(info.host, info.port, peer.cancels);
  if (peer.cancels.raised()) return kConnectTimedOut;
  // Kept: the resolver's number is shown as a system error; hosts know the texts that this gives.
  if (!host.address) return system_failure(host.error);
  Socket socket = make_socket(SOCK_STREAM);
  if (!socket.valid() || !set_receive_buffer(socket.get(), kReceiveBuffer)) return system_failure();
  if (!make_nonblocking(socket.get())) return system_failure();
  const int connected = connect_within(socket.get(), *host.address, limit_of(peer));
  if (connected != 1) return wait_failure(connected, kConnectTimedOut);
  if (!make_blocking(socket.get())) return system_failure();
  return socket;
}

Result<> send_request(int socket, const HttpPeer& peer, const std::string& path) {
  const SLibDConnectionInfo& info = peer.connection;
  std::string credentials = basic_credentials(info.userName, info.password);
  const WipedAtEnd wiped_credentials(credentials);
  Formatted request = http_get_request({info.host, info.port, path, credentials});
  const WipedAtEnd wiped_request(request.text);
  if (request.cut) return kUrlTooLong;
  if (peer.log.is_on()) peer.log.write("To", path.c_str());
  if (!send_once(socket, request.text.data(), request.text.size())) return system_failure();
  return {};
}

Result<> read_status(int socket, const HttpPeer& peer) {
  char header[kHeaderRoom];
  const auto length = receive_header(socket, header, limit_of(peer));
  if (!length) return length.failure();
  if (*length == 0) return kNoReason;
  const auto line = parse_status_line({header, static_cast<std::size_t>(*length)}, "HTTP/");
  if (!line) return kStatusNotFound;
  if (peer.log.is_on()) {
    // Safe: a camera that sends the credentials back in its reason phrase does not put them into the log.
    const SLibDConnectionInfo& info = peer.connection;
    const std::string reason = without_credentials(line->reason, info.userName, info.password);
    peer.log.write("From", format_within(kHeaderRoom, "%d %s", line->status, reason.c_str()).text.c_str());
  }
  if (line->status == kStatusOk || line->status == kStatusNoContent) return {};
  return Failure{line->status == kStatusUnauthorized ? LIBD_UNAUTHORIZED : LIBD_FAILED, line->reason};
}

}  // namespace

Result<Socket> open_http(const HttpPeer& peer, const std::string& path) {
  Result<Socket> socket = connect_http(peer);
  if (!socket) return socket;
  // A path that was cut when it was formatted makes a request that does not fit either, and is refused here.
  const auto sent = send_request(socket->get(), peer, path);
  if (!sent) return sent.failure();
  const auto accepted = read_status(socket->get(), peer);
  if (!accepted) return accepted.failure();
  if (!make_nonblocking(socket->get())) return system_failure();
  return socket;
}

Result<std::string> inquire(const HttpPeer& peer, const std::string& name, int most) {
  std::string answer(static_cast<std::size_t>(most), '\0');
  auto socket = open_http(peer, format_within(kRequestRoom, "/command/inquiry.cgi?inq=%s", name.c_str()).text);
  if (!socket) return socket.failure();
  const auto received = receive_all(socket->get(), answer, limit_of(peer));
  shutdown_and_close(socket->release());
  if (!received) return received.failure();
  answer.resize(before_nul(answer).size());
  return answer;
}

}  // namespace vexa
