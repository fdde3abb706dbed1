// From a host name to a connected TCP socket.
#pragma once

#include <netinet/in.h>

#include <optional>
#include <string>

#include "transport/socket.h"
#include "transport/wait_budget.h"

namespace vexa {

/// What a host name came to.
struct ResolvedHost {
  std::optional<sockaddr_in> address;  ///< the first one, with the port
  int error = 0;                       ///< the resolver's number when there is none
};

/// Looks an IPv4 host name or dotted address up. A name is looked up beside the calling thread where `cancels` may end
/// the wait for it: no address and the error of a resolver to be asked again. What is found later is thrown away.
ResolvedHost resolve_host(const std::string& host, int port, Cancels cancels = {});

/// An IPv4 socket, close-on-exec, of SOCK_STREAM or SOCK_DGRAM; invalid with errno on failure.
Socket make_socket(int type);

/// False with errno on failure.
bool set_receive_buffer(int socket, int bytes);

/// Connects a non-blocking socket and waits for it within the limit: 1 (connected, or refused: the first
/// send tells), 0 (no answer in time) or -1 (errno says why).
int connect_within(int socket, const sockaddr_in& address, WaitLimit limit);

}  // namespace vexa
