// RTSP sessions: opening, keeping alive, closing.
#pragma once

#include <netinet/in.h>

#include <cstdint>
#include <span>
#include <string>
#include <string_view>

#include "runtime/base/result.h"
#include "runtime/base/text.h"
#include "transport/socket.h"
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
Result<int> receive_rtsp_answer(int socket, std::span<char> room, int timeout);

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

/// Makes the requests of one session. Holds no socket of its own between calls: its state is in fields of the driver,
/// which outlive it. Used by the thread that owns these fields. Each request is traced to standard output.
class RtspSession {
 public:
  struct Fields {
    int& cseq;
    char (&credentials)[kRtspCredentialsRoom];  ///< Basic, in Base64
    const std::string& url;
    const int& session;
  };

  explicit RtspSession(Fields fields) : fields_(fields) {}

  /// The first step of each open: resolves the host and makes the socket. `timeout` (milliseconds, used in whole
  /// seconds) is that of single reads and sends.
  Result<RtspServer> begin(const std::string& host, int port, int timeout);

  struct Opening {
    const SLibDConnectionInfo& connection;
    const std::string& url;
    int scale;       ///< of the playback
    int media_port;  ///< where RTP goes, or kInterleaved
    StreamClock clock;
  };

  /// Connects, describes, sets up and plays: the session's number. A description without a range clock is refused
  /// inside the connection and taken over UDP.
  Result<int> open(const RtspServer& server, const Opening& opening);

  /// One GET_PARAMETER, whose answer is taken off the socket and ignored.
  Result<> keep_alive(int socket);

  /// One TEARDOWN. `timeout` is that of the answer.
  Result<> tear_down(int socket, int timeout);

 private:
  Result<std::string> exchange(const Formatted& request, const Opening& opening);
  Result<> take_clocks(const std::string& description, const Opening& opening) const;
  Result<int> set_up(const Opening& opening);

  Fields fields_;
  int socket_ = -1;  ///< of the session being opened
};

}  // namespace vexa
