// CVexaCommon: datagrams of an RTP session over UDP.
#include <algorithm>
#include <cerrno>
#include <cstring>
#include <ctime>

#include "device/driver_state.h"
#include "transport/failure.h"
#include "transport/socket.h"
#include "transport/wait_budget.h"
#include "transport/wire/rtp_header.h"
#include "vexa/runtime.h"
#include "vexa/vexa_common.h"

namespace {

/// The longest datagram that UDP carries over IPv4, and one more.
constexpr int kLeastBuffer = 65535;

vexa::Bytes bytes_of(const char* buffer, int length) {
  return {reinterpret_cast<const unsigned char*>(buffer), static_cast<std::size_t>(length)};
}

bool is_empty(int error) { return error == EAGAIN || error == EWOULDBLOCK; }

bool is_signalled(int event) { return event != -1 && vexa::WaitBudget(0).wait_readable(event) == 1; }

void nap(std::chrono::microseconds length) {
  if (length.count() == 0) return;
  const timespec duration{0, static_cast<long>(std::chrono::nanoseconds(length).count())};
  nanosleep(&duration, nullptr);  // a signal may cut it short: the datagrams are read all the same
}

}  // namespace

// Reads first and waits only when nothing is there: one system call a datagram while data keep coming.
int CVexaCommon::rtp_over_udp_recvn(int socket, char* buffer, int length, int timeout) {
  vexa::BurstGather* gather = m_State->rtp ? &m_State->rtp->gather : nullptr;
  const std::size_t room = static_cast<std::size_t>(std::max(length, 0));
  ssize_t count = vexa::receive_waiting(socket, buffer, room);
  if (count < 0 && is_empty(errno) && gather != nullptr && !m_State->rtp->collector.is_empty()) {
    const std::chrono::microseconds pause = gather->goes_on();
    if (pause.count() > 0) {
      nap(pause);
      count = vexa::receive_waiting(socket, buffer, room);
    }
  }
  if (count < 0 && is_empty(errno)) {
    int stop = -1;
    eventFd(m_StopVideoEvent, stop);
    const int ready = vexa::WaitBudget(timeout).wait_readable_unless(socket, stop);
    if (ready == 0 && is_signalled(stop)) return -1;  // ended from this side: nothing to record
    if (ready == 0) return Fail(vexa::kReceiveTimedOut);
    if (ready < 0) return FailSystem();
    if (gather != nullptr) nap(gather->woken());
    count = vexa::receive_waiting(socket, buffer, room);
  }
  if (count < 0) return FailSystem();
  if (gather != nullptr) gather->received(static_cast<std::size_t>(count));
  return static_cast<int>(count);
}

int CVexaCommon::rtp_over_udp_payload_recv(int socket, char* buffer, int size, int timeout, SPacketInfo& packet) {
  ClearLatestError();
  if (size < kLeastBuffer) return Fail(vexa::kInvalidArgument);
  const int length = rtp_over_udp_recvn(socket, buffer, size, timeout);
  if (length < 0) return -1;
  packet.received = true;
  if (const auto header = vexa::parse_rtp_header(bytes_of(buffer, length))) {
    packet.marker = header->marker;
    packet.payloadType = header->payload_type;
    packet.data = reinterpret_cast<unsigned char*>(buffer);
    packet.length = static_cast<std::uint32_t>(length);
    packet.timestamp = header->timestamp;
    packet.sequence = header->sequence;
  }
  return length;
}

int CVexaCommon::rtp_over_udp_payload_recv_h264(int socket, char* buffer, int size, int timeout, SPacketInfo& packet) {
  return rtp_over_udp_payload_recv(socket, buffer, size, timeout, packet);
}

int CVexaCommon::rtp_over_udp_payload_recv(int socket, char* buffer, int size, bool* marker, unsigned char* payloadType,
                                           int timeout, unsigned int* timestamp, unsigned short* sequence) {
  ClearLatestError();
  if (size < kLeastBuffer) return Fail(vexa::kInvalidArgument);
  const int length = rtp_over_udp_recvn(socket, buffer, size, timeout);
  if (length < 0) return -1;
  const auto header = vexa::parse_rtp_header(bytes_of(buffer, length));
  if (!header) return length;
  if (marker != nullptr) *marker = header->marker;
  if (payloadType != nullptr) *payloadType = header->payload_type;
  if (timestamp != nullptr) *timestamp = header->timestamp;
  if (sequence != nullptr) *sequence = header->sequence;
  const int payload = length - static_cast<int>(vexa::kRtpHeaderSize);
  std::memmove(buffer, buffer + vexa::kRtpHeaderSize, static_cast<std::size_t>(payload));
  return payload;
}
