// The driver's RTSP requests (RFC 2326), byte for byte; cameras depend on their form.
#pragma once

#include <string>

#include "runtime/base/text.h"

namespace vexa {

/// What each request carries.
struct RtspHead {
  const std::string& url;
  int cseq;
  const char* credentials;  ///< Basic, in Base64
};

/// What a PLAY request carries.
struct RtspPlay {
  int session;
  int scale;
};

// Each is cut if it does not fit.
Formatted rtsp_describe(const RtspHead& head);
/// Names `port` and the one after it for RTP over UDP.
Formatted rtsp_setup_udp(const RtspHead& head, int port);
/// Takes RTP inside the RTSP connection.
Formatted rtsp_setup_interleaved(const RtspHead& head);
Formatted rtsp_play(const RtspHead& head, const RtspPlay& play);
Formatted rtsp_get_parameter(const RtspHead& head, int session);
Formatted rtsp_teardown(const RtspHead& head, int session);

}  // namespace vexa
