// SPDX-License-Identifier: Apache-2.0
// The driver's RTSP requests (RFC 2326), byte for byte; cameras depend on their form.
#pragma once

#include <ctime>
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

/// Seconds between two keep-alives of a session that the camera ends after `session_timeout` idle seconds.
int keep_alive_interval(int session_timeout);

/// Whether one is due at `now`; `last` is 0 before the first, and one from the future does not count.
bool keep_alive_due(std::time_t now, std::time_t last, int interval);

}  // namespace vexa
