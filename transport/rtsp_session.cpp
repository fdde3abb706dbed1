// RTSP sessions: opening, reading answers, closing.
#include <netinet/in.h>
#include <sys/socket.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdarg>
#include <cstdio>
#include <new>
#include <thread>
#include <utility>
#include <vector>

#include "device/driver_state.h"
#include "runtime/base/base64.h"
#include "runtime/base/sync.h"
#include "runtime/base/text.h"
#include "transport/failure.h"
#include "transport/socket.h"
#include "transport/tcp_connect.h"
#include "transport/wait_budget.h"
#include "transport/wire/http_answer.h"
#include "transport/wire/http_request.h"
#include "transport/wire/range_clock.h"
#include "transport/wire/rtsp_answer.h"
#include "transport/wire/rtsp_request.h"
#include "vexa/vexa_common.h"

namespace {

constexpr int kMediaReceiveBuffer = 524288;
constexpr int kAnswerRoom = 1023;
constexpr int kMillisecondsPerSecond = 1000;

constexpr int kRtspOk = 200;
constexpr int kRtspUnauthorized = 401;

/// A non-blocking socket whose single reads and sends end after whole seconds of the time-out; invalid with errno.
vexa::Socket make_control_socket(int timeout) {
  vexa::Socket control = vexa::make_socket(SOCK_STREAM);
  if (!control.valid() || !vexa::make_nonblocking(control.get())) return vexa::Socket();
  const timeval limit{timeout / kMillisecondsPerSecond, 0};
  setsockopt(control.get(), SOL_SOCKET, SO_RCVTIMEO, &limit, sizeof limit);
  setsockopt(control.get(), SOL_SOCKET, SO_SNDTIMEO, &limit, sizeof limit);
  return control;
}

}  // namespace

int CVexaCommon::rtp_over_udp_open(const char* format, ...) {
  va_list arguments;
  va_start(arguments, format);
  const std::string url = vexa::vformat_within(vexa::kRequestRoom, format, arguments).text;
  va_end(arguments);
  const SLibDConnectionInfo info = ConnectionInfo();
  sockaddr_in address{};
  vexa::Socket control(MakeRtspSocket(info, address));
  if (!control.valid()) return -1;
  const int port = BindMediaSocket();
  if (port == -1 || !ConnectRtsp(control.get(), address, info)) return -1;
  std::string description;
  if (!DescribeRtsp(control.get(), url, description)) return -1;
  if (!TakeRangeClock(description) || !TakeClockRate(description)) return -1;
  int session = 0;
  const vexa::RtspHead set_up{url, ++m_RtspCSeq, m_BasicCredentials};
  if (!SetUpRtsp(control.get(), vexa::rtsp_setup_udp(set_up, port), session)) return -1;
  if (!PlayRtsp(control.get(), url, session)) return -1;
  // Kept: the time of the last keep-alive is not reset; a new session's first one waits for the rest of the interval.
  m_RtspUrl = url;
  m_RtspSession = session;
  return control.release();
}

// What every open begins with: the camera's address, and a socket to connect.
int CVexaCommon::MakeRtspSocket(const SLibDConnectionInfo& info, sockaddr_in& address) {
  ClearLatestError();
  m_RtspCSeq = 0;
  const vexa::ResolvedHost host = vexa::resolve_host(info.host, RtspPort());
  if (!host.address) return FailSystem(host.error);
  address = *host.address;
  const int socket = make_control_socket(info.timeout).release();
  return socket == -1 ? FailSystem() : socket;
}

int CVexaCommon::RtspPort() {
  const vexa::Guard guard(m_ConnectionLock);
  return m_CameraInfo.rtspPort;
}

// Kept: the media socket stays open when the open fails later on; its caller tells by it how far the open came.
int CVexaCommon::BindMediaSocket() {
  SetStreamSocket(vexa::make_socket(SOCK_DGRAM).release());
  if (m_StreamSocket == -1) return FailSystem();
  vexa::set_receive_buffer(m_StreamSocket, kMediaReceiveBuffer);
  sockaddr_in address{};
  address.sin_family = AF_INET;
  socklen_t length = sizeof address;
  if (bind(m_StreamSocket, reinterpret_cast<sockaddr*>(&address), length) != 0) return FailSystem();
  // Safe: reusable only once it is bound; two sessions with reusable sockets could be given the same free port.
  const int reuse = 1;
  setsockopt(m_StreamSocket, SOL_SOCKET, SO_REUSEADDR, &reuse, sizeof reuse);
  if (getsockname(m_StreamSocket, reinterpret_cast<sockaddr*>(&address), &length) != 0) return FailSystem();
  return ntohs(address.sin_port);
}

bool CVexaCommon::ConnectRtsp(int socket, const sockaddr_in& address, const SLibDConnectionInfo& info) {
  const int connected = vexa::connect_within(socket, address, info.timeout);
  if (connected != 1) {
    FailWait(connected, vexa::kConnectTimedOut);
    return false;
  }
  if (!vexa::make_blocking(socket)) {
    FailSystem();
    return false;
  }
  base64Encode(vexa::joined_credentials(info.userName, info.password).c_str(), m_BasicCredentials);
  return true;
}

bool CVexaCommon::SendRtsp(int socket, const std::string& request) {
  // Kept: the trace shows each request whole, credentials included; support reads it from the host's console.
  std::printf("send <%s>\n", request.c_str());
  return vexa::send_once(socket, request.data(), request.size());
}

bool CVexaCommon::ReceiveRtsp(int socket, int timeout, std::string& answer) {
  char text[kAnswerRoom + 1];
  const int length = rtp_over_tcp_header_recv(socket, text, kAnswerRoom, timeout);
  if (length < 0) return false;
  answer.assign(text, static_cast<std::size_t>(length));
  const auto line = vexa::parse_status_line(answer, "RTSP/");
  if (!line) {
    Fail(vexa::kStatusNotFound);
    return false;
  }
  if (line->status == kRtspOk) return true;
  Fail({line->status == kRtspUnauthorized ? LIBD_UNAUTHORIZED : LIBD_FAILED, line->reason.c_str()});
  return false;
}

bool CVexaCommon::ExchangeRtsp(int socket, const vexa::Formatted& request, std::string& answer) {
  if (request.cut) {
    Fail(vexa::kUrlTooLong);
    return false;
  }
  if (SendRtsp(socket, request.text)) return ReceiveRtsp(socket, ConnectionTimeout(), answer);
  FailSystem();
  return false;
}

bool CVexaCommon::DescribeRtsp(int socket, const std::string& url, std::string& description) {
  const vexa::RtspHead head{url, ++m_RtspCSeq, m_BasicCredentials};
  return ExchangeRtsp(socket, vexa::rtsp_describe(head), description);
}

// Kept: a description without a clock opens over UDP; live cameras send none.
bool CVexaCommon::TakeRangeClock(const std::string& answer) {
  const auto text = vexa::range_clock_text(answer);
  if (!text || parse_clock(std::string(*text).c_str())) return true;
  Fail(vexa::kUnknownClock);
  return false;
}

bool CVexaCommon::TakeClockRate(const std::string& answer) {
  const vexa::RtpClock clock = vexa::rtp_clock(answer);
  switch (clock.found) {
    case vexa::RtpClock::Found::kRate:
      m_RtpClockRate = clock.rate;
      return true;
    case vexa::RtpClock::Found::kNoRtpmap:
      Fail(vexa::kRtpmapNotFound);
      return false;
    case vexa::RtpClock::Found::kNoSlash:
      Fail(vexa::kRtpmapSlashNotFound);
      return false;
    case vexa::RtpClock::Found::kNoNumber:
      Fail(vexa::kClockUnitNotFound);
      return false;
  }
  return false;
}

bool CVexaCommon::SetUpRtsp(int socket, const vexa::Formatted& request, int& session) {
  std::string answer;
  if (!ExchangeRtsp(socket, request, answer)) return false;
  const auto number = vexa::session_number(answer);
  if (!number) {
    Fail(vexa::kSessionNotFound);
    return false;
  }
  session = *number;
  return true;
}

bool CVexaCommon::PlayRtsp(int socket, const std::string& url, int session) {
  const int scale = m_EdgeStoragePlayback ? m_PlaybackScale : 1;
  const vexa::RtspHead head{url, ++m_RtspCSeq, m_BasicCredentials};
  std::string answer;
  return ExchangeRtsp(socket, vexa::rtsp_play(head, {session, scale}), answer);
}

// Kept: every look is put behind the one before, and the answer is read behind the last look, as far as there is room.
// An answer that comes in one piece and fills no more than half the buffer stands whole at the buffer's beginning; of a
// longer one, or one that came in pieces, only a part is seen.
int CVexaCommon::rtp_over_tcp_header_recv(int socket, char* buffer, int size, int timeout) {
  ClearLatestError();
  const int ready = vexa::WaitBudget(timeout).wait_readable(socket);
  if (ready != 1) return FailWait(ready, vexa::kReceiveTimedOut);
  // Safe: nothing that stood in the buffer before is taken for the camera's.
  const std::size_t room = static_cast<std::size_t>(std::max(size, 0));
  std::fill_n(buffer, room, '\0');
  // Kept: one look a second, for whole seconds; a time-out below a second sees no answer.
  const int looks = timeout / kMillisecondsPerSecond;
  std::size_t filled = 0;
  int looked = 0;
  while (looked < looks) {
    const ssize_t peeked = recv(socket, buffer + filled, room - filled, MSG_PEEK);
    if (peeked < 0) return FailSystem();
    const std::size_t latest = std::exchange(filled, filled + static_cast<std::size_t>(peeked));
    if (vexa::rtsp_header_complete({buffer, filled}, latest)) break;
    ++looked;
    std::this_thread::sleep_for(std::chrono::seconds(1));
  }
  if (looked == looks) return Fail(vexa::kReceiveTimedOut);
  const ssize_t received = recv(socket, buffer + filled, room - filled, 0);
  return received < 0 ? FailSystem() : static_cast<int>(received);
}

bool CVexaCommon::parse_clock(const char* text) {
  if (text == nullptr) return false;
  const vexa::RangeClock clock = vexa::parse_range_clock(text);
  if (clock.seconds) m_RangeClockSeconds = *clock.seconds;
  if (clock.understood) m_RangeClockMicros = clock.micros;
  return clock.understood;
}

void CVexaCommon::rtp_over_udp_close() {
  if (m_RtspSocket == -1 && m_StreamSocket == -1) return;
  // Kept: the switch that recordings are played with holds for live sessions too.
  if (WantsTearDown()) {
    try {
      TearDown();
    } catch (const std::bad_alloc&) {
      FailSystem(ENOMEM);
    }
  }
  rtp_stream_socket_close_all();
}

// The host may change its mind at any time.
bool CVexaCommon::WantsTearDown() {
  const vexa::Guard guard(m_VideoStateLock);
  return !m_NoTearDown;
}

void CVexaCommon::TearDown() {
  const vexa::RtspHead head{m_RtspUrl, ++m_RtspCSeq, m_BasicCredentials};
  const vexa::Formatted request = vexa::rtsp_teardown(head, m_RtspSession);
  // Kept: a text that is too long is sent cut, for the camera to refuse.
  if (request.cut) Fail(vexa::kUrlTooLong);
  if (!SendRtsp(m_RtspSocket, request.text)) FailSystem();
  std::string answer;
  ReceiveRtsp(m_RtspSocket, m_State->teardown_timeout, answer);
}

void CVexaCommon::rtp_stream_socket_close_all() {
  vexa::shutdown_and_close(std::exchange(m_RtspSocket, -1));
  vexa::shutdown_and_close(m_StreamSocket);
  SetStreamSocket(-1);
}

unsigned char* CVexaCommon::base64Decode(const char* text, unsigned int& size, bool trim) {
  std::vector<unsigned char> bytes = vexa::base64_decode(text == nullptr ? "" : text);
  while (trim && !bytes.empty() && bytes.back() == 0) bytes.pop_back();
  size = static_cast<unsigned int>(bytes.size());
  auto* copy = new unsigned char[bytes.size()];
  std::copy(bytes.begin(), bytes.end(), copy);
  return copy;
}
