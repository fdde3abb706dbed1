// RTP inside the RTSP connection.
#include <netinet/in.h>

#include <algorithm>
#include <cerrno>
#include <cstdarg>
#include <new>

#include "runtime/base/text.h"
#include "transport/failure.h"
#include "transport/socket.h"
#include "transport/tcp_connect.h"
#include "transport/wait_budget.h"
#include "transport/wire/http_request.h"
#include "transport/wire/interleaved.h"
#include "transport/wire/rtp_header.h"
#include "transport/wire/rtsp_answer.h"
#include "transport/wire/rtsp_request.h"
#include "vexa/vexa_common.h"

namespace {

constexpr int kSharedReceiveBuffer = 131072;
constexpr int kLeastPacketRoom = 65535;
constexpr int kPacketWait = 1000;  // milliseconds, whatever the caller's time-out

vexa::Bytes bytes_from(const char* buffer, std::size_t length) {
  return {reinterpret_cast<const unsigned char*>(buffer), length};
}

}  // namespace

// Safe: a session that memory does not hold is a failure and not an exception.
int CVexaCommon::rtp_over_tcp_open(const char* format, ...) try {
  va_list arguments;
  va_start(arguments, format);
  const std::string url = vexa::vformat_within(vexa::kRequestRoom, format, arguments).text;
  va_end(arguments);
  const SLibDConnectionInfo info = ConnectionInfo();
  sockaddr_in address{};
  vexa::Socket socket(MakeRtspSocket(info, address));
  if (!socket.valid()) return -1;
  vexa::set_receive_buffer(socket.get(), kSharedReceiveBuffer);
  if (!ConnectRtsp(socket.get(), address, info)) return -1;
  std::string description;
  if (!DescribeRtsp(socket.get(), url, description)) return -1;
  // Kept: this way a description must have a clock, over UDP it need not.
  if (!vexa::range_clock_text(description)) return Fail(vexa::kClockNotFound);
  if (!TakeRangeClock(description) || !TakeClockRate(description)) return -1;
  int session = 0;
  const vexa::RtspHead set_up{url, ++m_RtspCSeq, m_BasicCredentials};
  if (!SetUpRtsp(socket.get(), vexa::rtsp_setup_interleaved(set_up), session)) return -1;
  if (!PlayRtsp(socket.get(), url, session)) return -1;
  SetStreamSocket(socket.get());
  return socket.release();
} catch (const std::bad_alloc&) {
  return FailSystem(ENOMEM);
}

// Reads first and waits only when nothing is there.
int CVexaCommon::rtp_over_tcp_recvn(int socket, char* buffer, int length, int timeout) {
  ClearLatestError();
  const vexa::WaitBudget budget(timeout);
  for (int filled = 0; filled < length;) {
    const ssize_t received = vexa::receive_waiting(socket, buffer + filled, static_cast<std::size_t>(length - filled));
    if (received == 0) return Fail(vexa::kConnectionClosed);
    if (received > 0) {
      filled += static_cast<int>(received);
      continue;
    }
    if (errno != EAGAIN && errno != EWOULDBLOCK) return FailSystem();
    const int ready = budget.wait_readable(socket);
    if (ready != 1) return FailWait(ready, vexa::kReceiveTimedOut);
  }
  return 0;
}

int CVexaCommon::rtp_over_tcp_payload_recv(int socket, char* buffer, int size, bool* marker, unsigned char* payloadType,
                                           int timeout, unsigned int* timestamp) {
  ClearLatestError();
  if (size < kLeastPacketRoom) return Fail(vexa::kInvalidArgument);
  const int ready = vexa::WaitBudget(kPacketWait).wait_readable(socket);
  if (ready == 0) return 0;
  if (ready != 1) return FailWait(ready, vexa::kReceiveTimedOut);
  char prefix[vexa::kInterleavedPrefixSize];
  if (rtp_over_tcp_recvn(socket, prefix, sizeof prefix, timeout) != 0) return -1;
  const auto length = vexa::interleaved_length(bytes_from(prefix, sizeof prefix));
  if (!length) return Fail(vexa::kNoDollar);
  char fixed[vexa::kRtpHeaderSize];
  if (rtp_over_tcp_recvn(socket, fixed, sizeof fixed, timeout) != 0) return -1;
  const vexa::RtpFront front = vexa::rtp_front(static_cast<std::uint8_t>(fixed[0]));
  if (front.version != vexa::kRtpVersionNumber) return Fail(vexa::kRtpVersion);
  // The contributing sources go where the payload will.
  if (rtp_over_tcp_recvn(socket, buffer, static_cast<int>(front.csrc_bytes), timeout) != 0) return -1;
  const auto payload = vexa::interleaved_payload(*length, front);
  if (!payload) return Fail(vexa::kPayloadLength);
  if (rtp_over_tcp_recvn(socket, buffer, static_cast<int>(*payload), timeout) != 0) return -1;
  const auto header = vexa::parse_rtp_header(bytes_from(fixed, sizeof fixed)).value_or(vexa::RtpHeader{});
  if (marker != nullptr) *marker = header.marker;
  if (payloadType != nullptr) *payloadType = header.payload_type;
  if (timestamp != nullptr) *timestamp = header.timestamp;
  return static_cast<int>(*payload);
}

void CVexaCommon::rtp_over_tcp_close(int socket) { vexa::shutdown_and_close(socket); }
