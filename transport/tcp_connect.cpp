#include "transport/tcp_connect.h"

#include <arpa/inet.h>
#include <netdb.h>
#include <sys/socket.h>

#include <cerrno>
#include <cstdint>
#include <cstring>

#include "transport/wait_budget.h"

namespace vexa {

ResolvedHost resolve_host(const std::string& host, int port) {
  hostent entry{};
  hostent* found = nullptr;
  char work[1024];
  ResolvedHost resolved;
  const int result = gethostbyname_r(host.c_str(), &entry, work, sizeof work, &found, &resolved.error);
  if (result != 0 || found == nullptr || found->h_addr_list[0] == nullptr) return resolved;
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_port = htons(static_cast<std::uint16_t>(port));
  std::memcpy(&address.sin_addr, found->h_addr_list[0], sizeof address.sin_addr);
  resolved.address = address;
  return resolved;
}

Socket make_socket(int type) { return Socket(socket(AF_INET, type | SOCK_CLOEXEC, 0)); }

bool set_receive_buffer(int socket, int bytes) {
  return setsockopt(socket, SOL_SOCKET, SO_RCVBUF, &bytes, sizeof bytes) == 0;
}

int connect_within(int socket, const sockaddr_in& address, int timeout) {
  const int result = connect(socket, reinterpret_cast<const sockaddr*>(&address), sizeof address);
  if (result != 0 && errno != EINPROGRESS) return -1;
  // Kept: a connection refused during the wait counts as made; hosts know the text that the first send then gives.
  return WaitBudget(timeout).wait_writable(socket);
}

}  // namespace vexa
