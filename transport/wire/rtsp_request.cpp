// SPDX-License-Identifier: Apache-2.0
#include "transport/wire/rtsp_request.h"

#include "transport/wire/http_request.h"

namespace vexa {
namespace {

constexpr int kLongestInterval = 30;
constexpr int kLongestHalvedTimeout = 60;
constexpr int kShortestHalvedTimeout = 3;

}  // namespace

Formatted rtsp_describe(const RtspHead& head) {
  return format_within(kRequestRoom,
                       "DESCRIBE %s RTSP/1.0\r\nCSeq: %d\r\nAccept: application/sdp\r\nAuthorization: Basic %s\r\n\r\n",
                       head.url.c_str(), head.cseq, head.credentials);
}

Formatted rtsp_setup_udp(const RtspHead& head, int port) {
  // Kept: the track is always the session's URL with "/video", whatever the description names; cameras answer to it.
  return format_within(kRequestRoom,
                       "SETUP %s/video RTSP/1.0\r\nCSeq: %d\r\nTransport: RTP/AVP;unicast;client_port=%d-%d\r\n"
                       "Authorization: Basic %s\r\n\r\n",
                       head.url.c_str(), head.cseq, port, port + 1, head.credentials);
}

Formatted rtsp_setup_interleaved(const RtspHead& head) {
  return format_within(kRequestRoom,
                       "SETUP %s/video RTSP/1.0\r\nCSeq: %d\r\n"
                       "Transport: RTP/AVP/TCP;unicast;interleaved=0-1;\r\nAuthorization: Basic %s\r\n\r\n",
                       head.url.c_str(), head.cseq, head.credentials);
}

Formatted rtsp_play(const RtspHead& head, const RtspPlay& play) {
  return format_within(kRequestRoom,
                       "PLAY %s RTSP/1.0\r\nCSeq: %d\r\nSession: %d\r\nScale: %d\r\nRange: npt=0.000-\r\n"
                       "Authorization: Basic %s\r\n\r\n",
                       head.url.c_str(), head.cseq, play.session, play.scale, head.credentials);
}

Formatted rtsp_get_parameter(const RtspHead& head, int session) {
  return format_within(kRequestRoom,
                       "GET_PARAMETER %s RTSP/1.0\r\nCSeq: %d\r\nSession: %d\r\nAccept: application/sdp\r\n"
                       "Authorization: Basic %s\r\n\r\n",
                       head.url.c_str(), head.cseq, session, head.credentials);
}

Formatted rtsp_teardown(const RtspHead& head, int session) {
  // Kept: no credentials, and one blank line more than the other requests; cameras end sessions on exactly this.
  return format_within(kRequestRoom, "TEARDOWN %s RTSP/1.0\r\nCSeq: %d\r\nSession: %d\r\n\r\n\r\n", head.url.c_str(),
                       head.cseq, session);
}

int keep_alive_interval(int session_timeout) {
  if (session_timeout > kLongestHalvedTimeout) return kLongestInterval;
  return session_timeout < kShortestHalvedTimeout ? 1 : session_timeout / 2;
}

bool keep_alive_due(std::time_t now, std::time_t last, int interval) {
  return last == 0 || last > now || now - last >= interval;
}

}  // namespace vexa
