// SPDX-License-Identifier: Apache-2.0
// RTSP sessions: opening, keeping alive, closing.
#pragma once

#include <netinet/in.h>

#include <chrono>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

#include "runtime/base/result.h"
#include "runtime/base/text.h"
#include "transport/socket.h"
#include "transport/wait_budget.h"
#include "vexa/system_info.h"

namespace vexa {

/// Room for the Base64 of 255 characters, with some to spare.
inline constexpr std::size_t kRtspCredentialsRoom = 345;

/// The clocks of a described stream, in fields of the session's owner.
struct StreamClock {
  std::int64_t& range_seconds;  ///< start of the range clock, since 1970-01-01 UTC
  int& range_micros;
  int& rtp_rate;  ///< ticks a second
};

/// Stores the range clock that `text` gives, as far as it can be read; false when that is not to its end.
bool take_range_clock(std::string_view text, StreamClock clock);

/// Takes an answer's header off the socket into `room`, and of what follows as much as has come: its length.
/// Once the peer has closed, the wait is over: no answer can come.
Result<int> receive_rtsp_answer(int socket, std::span<char> room, WaitLimit limit);

/// Binds a datagram socket to a port of its own: the port. The socket stays the caller's, also on failure.
Result<int> bind_media_socket(int socket);

/// Instead of a media port: RTP comes inside the connection.
inline constexpr int kInterleaved = 0;

/// A datagram socket for media; invalid with errno on failure.
Socket make_media_socket();

/// A camera's RTSP port, resolved, and the socket to connect to it.
struct RtspServer {
  Socket socket;
  sockaddr_in address;
};

/// A keep-alive's answer that has not come yet.
struct AwaitedAnswer {
  std::chrono::steady_clock::time_point give_up;
  bool begun = false;        ///< a part of it was there at the look
  bool request_cut = false;  ///< the request did not fit and was sent cut
};

/// Takes what a session traces: each request, how the keep-alives went, and the answers. Used by the thread that owns
/// the session.
class RequestTrace {
 public:
  /// `line` has no line break at its end; a request has those of the protocol. It may hold `credentials`.
  virtual void write(const std::string& line, const char* credentials) = 0;
  /// An answer that was taken; it may hold `credentials`.
  virtual void answered(const std::string& answer, const char* credentials) = 0;
  /// None came, or it was a refusal.
  virtual void unanswered(const Failure& failure) = 0;

 protected:
  ~RequestTrace() = default;
};

/// Makes the requests of one session. Holds no socket of its own between calls: its state is in fields of the driver,
/// owns them. Every request is traced.
class RtspSession {
 public:
  struct Fields {
    int& cseq;
    char (&credentials)[kRtspCredentialsRoom];  ///< Basic, in Base64
    const std::string& url;
    const int& session;
  };

  RtspSession(Fields fields, RequestTrace& trace) : fields_(fields), trace_(trace) {}

  /// What every open begins with. The limit is for single reads and sends, in whole seconds.
  Result<RtspServer> begin(const std::string& host, int port, WaitLimit limit);

  struct Opening {
    const SLibDConnectionInfo& connection;
    const std::string& url;
    int scale;       ///< of the playback
    int media_port;  ///< where RTP goes, or kInterleaved
    StreamClock clock;
    Cancels cancels = {};
  };

  /// Connects, describes, sets up and plays: the session's number. A description without a range clock is refused
  /// inside the connection and taken over UDP.
  Result<int> open(const RtspServer& server, const Opening& opening);

  /// Sends one GET_PARAMETER, whose answer is awaited from then on.
  AwaitedAnswer send_keep_alive(int socket);
  /// What came of the keep-alive: none while its answer is awaited. Takes the answer off the socket and does not read
  /// it. Waits for nothing.
  std::optional<Result<>> keep_alive_outcome(int socket, AwaitedAnswer& awaited);
  /// The same, once it is known; a cancel counts as an answer that has not come in time.
  Result<> wait_for_keep_alive(int socket, AwaitedAnswer& awaited, Cancels cancels = {});

  /// One TEARDOWN. The limit is that of the answer.
  Result<> tear_down(int socket, WaitLimit limit);

  /// Requests that were sent, or tried to be.
  std::uint64_t requests() const { return requests_; }

 private:
  bool send(int socket, const std::string& request);
  Result<std::string> receive(int socket, WaitLimit limit);
  Result<std::string> exchange(Formatted request, const Opening& opening);
  Result<> take_clocks(const std::string& description, const Opening& opening) const;
  Result<int> set_up(const Opening& opening);

  Fields fields_;
  RequestTrace& trace_;
  int socket_ = -1;  ///< of the session being opened
  std::uint64_t requests_ = 0;
};

}  // namespace vexa
