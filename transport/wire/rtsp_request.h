// What the driver says over RTSP (RFC 2326), each request as cameras have always been sent it.
#pragma once

#include <string>

#include "runtime/base/text.h"

namespace vexa {

/// What every request carries.
struct RtspHead {
  const std::string& url;
  int cseq;
  const char* credentials;  ///< Basic, in Base64
};

/// What a session is played with.
struct RtspPlay {
  int session;
  int scale;
};

// Each is cut when it does not fit.
Formatted rtsp_describe(const RtspHead& head);
/// Names `port` and the one behind it for RTP over UDP.
Formatted rtsp_setup_udp(const RtspHead& head, int port);
/// Takes RTP inside the RTSP connection.
Formatted rtsp_setup_interleaved(const RtspHead& head);
Formatted rtsp_play(const RtspHead& head, const RtspPlay& play);
Formatted rtsp_get_parameter(const RtspHead& head, int session);
Formatted rtsp_teardown(const RtspHead& head, int session);

}  // namespace vexa
