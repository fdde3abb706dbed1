// HTTP/1.0 exchanges with the camera, each over a connection of its own.
#pragma once

#include <string>

#include "runtime/base/result.h"
#include "transport/socket.h"
#include "transport/wait_budget.h"
#include "vexa/system_info.h"

namespace vexa {

/// Takes the lines of the CGI log. Used by any thread that speaks to the camera.
class ExchangeLog {
 public:
  virtual bool is_on() const = 0;
  /// `direction` is "To" or "From"; both texts are the caller's.
  virtual void write(const char* direction, const char* message) = 0;

 protected:
  ~ExchangeLog() = default;
};

/// Whom to ask, as whom, for how long; a copy, so that no setting changes in the middle of an exchange.
struct HttpPeer {
  SLibDConnectionInfo connection;
  ExchangeLog& log;
  Cancels cancels = {};
};

/// Requests `path` and reads the header of the answer: the non-blocking socket with the body left on it. An answer
/// other than 200 and 204 is a failure with the camera's reason, LIBD_UNAUTHORIZED for 401. Connecting and reading may
/// each block for the connection's time-out.
Result<Socket> open_http(const HttpPeer& peer, const std::string& path);

/// Sends the inquiry `name`: the answer's body up to its first NUL, at most `most` bytes of it.
Result<std::string> inquire(const HttpPeer& peer, const std::string& name, int most);

}  // namespace vexa
