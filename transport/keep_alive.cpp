// Keeping an open session alive.
#include <cstdio>

#include "device/driver_state.h"
#include "transport/failure.h"
#include "transport/wire/keep_alive_schedule.h"
#include "transport/wire/rtsp_request.h"
#include "vexa/vexa_common.h"

namespace {

constexpr int kKeepAliveAnswerRoom = 1023;
constexpr int kAnswerTimeout = 1000;  // milliseconds

}  // namespace

void CVexaCommon::KeepAlive() {
  // Kept: only 0 stops it. A closed session, -1, goes on: its send fails harmlessly and shows in the trace.
  if (m_RtspSocket == 0) return;
  const std::time_t now = m_State->now();
  if (!vexa::keep_alive_due(now, m_LastKeepAliveTime, vexa::keep_alive_interval(m_KeepAlivePeriod))) return;
  m_LastKeepAliveTime = now;
  const vexa::RtspHead head{m_RtspUrl, ++m_RtspCSeq, m_BasicCredentials};
  const vexa::Formatted request = vexa::rtsp_get_parameter(head, m_RtspSession);
  // Kept: a text that is too long is sent cut; the text of the error ends in a line break, as hosts have seen it.
  if (request.cut) Fail(vexa::kKeepAliveTooLong);
  const bool sent = SendRtsp(m_RtspSocket, request.text);
  std::puts(sent ? "successfully sending getparameter" : "error sending getparameter");
  char answer[kKeepAliveAnswerRoom + 1];
  if (rtp_over_tcp_header_recv(m_RtspSocket, answer, kKeepAliveAnswerRoom, kAnswerTimeout) < 0) {
    std::puts("error receiving getparameter");
  }
}
