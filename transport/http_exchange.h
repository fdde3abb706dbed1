// SPDX-License-Identifier: Apache-2.0
// HTTP/1.0 exchanges with the camera, each over a connection of its own.
#pragma once

#include <string>

#include "runtime/base/result.h"
#include "transport/private_connection.h"
#include "transport/socket.h"
#include "transport/wait_budget.h"
#include "vexa/system_info.h"

namespace vexa {

/// Receives the lines of the CGI log. Used by any thread that sends requests to the camera.
class ExchangeLog {
 public:
  virtual bool is_on() const = 0;
  /// `direction` is "To" or "From"; both texts are the caller's.
  virtual void write(const char* direction, const char* message) = 0;

 protected:
  ~ExchangeLog() = default;
};

/// The camera, the user and the time-out of an exchange; a copy, so that no setting changes in the middle of it.
struct HttpPeer {
  PrivateConnection connection;
  ExchangeLog& log;
  Cancels cancels = {};
};

/// Requests `path` and reads the header of the answer: the non-blocking socket with the body left on it. An answer
/// other than 200 and 204 is a failure with the camera's reason, LIBD_UNAUTHORIZED for 401. Blocks for
/// the connection's time-out at most three times: for connecting, the answer's first byte and the rest of its header.
Result<Socket> open_http(const HttpPeer& peer, const std::string& path);

/// Sends the inquiry `name`: the answer's body up to its first NUL, at most `most` bytes of it.
Result<std::string> inquire(const HttpPeer& peer, const std::string& name, int most);

}  // namespace vexa
