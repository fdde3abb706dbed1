// SPDX-License-Identifier: Apache-2.0
// The RTSP members: opening a session, keeping it alive, closing it, reading packets.
#include "transport/rtsp_session.h"

#include <algorithm>
#include <chrono>
#include <cstdarg>
#include <cstring>
#include <utility>
#include <vector>

#include "device/driver_state.h"
#include "media/frame_chronicle.h"
#include "runtime/base/base64.h"
#include "runtime/base/moment.h"
#include "transport/control_socket.h"
#include "transport/failure.h"
#include "transport/interleaved_stream.h"
#include "transport/rtp_socket.h"
#include "transport/wire/http_request.h"
#include "transport/wire/rtp_header.h"
#include "transport/wire/rtsp_request.h"

namespace vexa {

RtspSession DriverState::session() {
  return RtspSession({driver.m_RtspCSeq, driver.m_BasicCredentials, driver.m_RtspUrl, driver.m_RtspSession}, echo);
}

StreamClock DriverState::stream_clock() {
  return {driver.m_RangeClockSeconds, driver.m_RangeClockMicros, driver.m_RtpClockRate};
}

Failure DriverState::count_rtsp(std::uint64_t requests, const Failure& failure) {
  exchanges.rtsp(requests, &failure);
  return failure;
}

// Kept: the media socket stays open when the open fails after it; its caller sees by it how far the open came.
Result<int> DriverState::open_rtp_over_udp(const std::string& url, int port) {
  errors.clear();
  const PrivateConnection info = connection.copy();
  const WaitLimit waits = limit(info.timeout);
  RtspSession session = this->session();
  auto server = session.begin(info.host, port, waits);
  if (!server) return count_rtsp(0, server.failure());
  set_stream_socket(make_media_socket().release());
  const int media = stream_socket();
  if (media == -1) return system_failure();
  const auto media_port = bind_media_socket(media);
  if (!media_port) return media_port;
  // Without the port beside it there are no sender reports, and the stream goes on as well.
  Socket control = bind_control_socket(*media_port);
  const int scale = driver.m_EdgeStoragePlayback ? driver.m_PlaybackScale : 1;
  const auto number = session.open(*server, {info, url, scale, *media_port, stream_clock(), waits.cancels});
  if (!number) return count_rtsp(session.requests(), number.failure());
  ledger.control_port(control.valid() ? *media_port + 1 : 0);
  chronicle->begin_stream(std::move(control), server->address.sin_addr.s_addr);
  exchanges.rtsp(session.requests(), nullptr);
  keep_alive.reset();
  // Kept: the time of the last keep-alive is not reset; a new session's first one waits for the rest of the interval.
  driver.m_RtspUrl = url;
  driver.m_RtspSession = *number;
  return server->socket.release();
}

Result<int> DriverState::open_rtp_over_tcp(const std::string& url, int port) {
  errors.clear();
  const PrivateConnection info = connection.copy();
  const WaitLimit waits = limit(info.timeout);
  RtspSession session = this->session();
  auto server = session.begin(info.host, port, waits);
  if (!server) return count_rtsp(0, server.failure());
  const int scale = driver.m_EdgeStoragePlayback ? driver.m_PlaybackScale : 1;
  const auto number = session.open(*server, {info, url, scale, kInterleaved, stream_clock(), waits.cancels});
  if (!number) return count_rtsp(session.requests(), number.failure());
  exchanges.rtsp(session.requests(), nullptr);
  keep_alive.reset();
  ledger.begin_stream(StreamTransport::kTcp);
  chronicle->begin_stream({}, server->address.sin_addr.s_addr);
  set_stream_socket(server->socket.get());
  return server->socket.release();
}

// A model class that reads packets itself does so in the thread that reads the stream.
void DriverState::count_passed_on(std::size_t length, const std::optional<RtpHeader>& header) {
  const auto arrival = std::chrono::steady_clock::now();
  ledger.datagram(length, arrival);
  ledger.passed_on();
  if (header) {
    ledger.place(header->ssrc, header->sequence);
    ledger.media(header->timestamp, driver.m_RtpClockRate, arrival);
  }
  if (!header || header->marker) ledger.publish();
}

void DriverState::take_interleaved(const InterleavedPacket& packet, const char* payload) {
  const auto length = static_cast<std::size_t>(packet.length);
  if (packet.control_front.empty()) return count_passed_on(kRtpHeaderSize + length, packet.header);
  std::vector<unsigned char> compound = packet.control_front;
  compound.insert(compound.end(), payload, payload + length);
  chronicle->take_control(compound, driver.m_RtpClockRate,
                          {nanoseconds_since_1970(), nanoseconds_of(std::chrono::steady_clock::now())});
  ledger.publish();
}

void DriverState::begin_keep_alive() {
  // Kept: only 0 stops it. A closed session, -1, goes on: its send fails harmlessly and shows in the trace.
  if (driver.m_RtspSocket == 0 || keep_alive) return;
  const std::time_t moment = now();
  if (!keep_alive_due(moment, driver.m_LastKeepAliveTime, keep_alive_interval(driver.m_KeepAlivePeriod))) return;
  driver.m_LastKeepAliveTime = moment;
  errors.clear();
  errors.run([&]() -> Outcome {
    keep_alive = session().send_keep_alive(driver.m_RtspSocket);
    return LIBD_OK;
  });
}

bool DriverState::look_for_keep_alive() {
  if (!keep_alive) return false;
  const bool begun = keep_alive->begun;
  errors.run([&]() -> Outcome {
    const auto outcome = session().keep_alive_outcome(driver.m_RtspSocket, *keep_alive);
    if (!outcome) return LIBD_OK;
    keep_alive.reset();
    exchanges.keep_alive(*outcome ? nullptr : &outcome->failure());
    if (!*outcome) return outcome->failure();
    return LIBD_OK;
  });
  return !keep_alive || keep_alive->begun != begun;
}

void DriverState::finish_keep_alive() {
  if (!keep_alive) return;
  AwaitedAnswer awaited = *std::exchange(keep_alive, std::nullopt);
  errors.run([&]() -> Outcome {
    const auto outcome = session().wait_for_keep_alive(driver.m_RtspSocket, awaited, limit().cancels);
    exchanges.keep_alive(outcome ? nullptr : &outcome.failure());
    if (!outcome) return outcome.failure();
    return LIBD_OK;
  });
}

}  // namespace vexa

int CVexaCommon::rtp_over_udp_open(const char* format, ...) {
  vexa::Operation operation(*m_State, __func__);
  va_list arguments;
  va_start(arguments, format);
  const int opened = m_State->errors.run([&] {
    const std::string url = vexa::vformat_within(vexa::kRequestRoom, format, arguments).text;
    return m_State->open_rtp_over_udp(url, m_State->rtsp_port());
  });
  va_end(arguments);
  return opened;
}

// For model classes whose cameras send RTP inside the connection; the driver's own streams come over UDP.
int CVexaCommon::rtp_over_tcp_open(const char* format, ...) {
  vexa::Operation operation(*m_State, __func__);
  va_list arguments;
  va_start(arguments, format);
  const int opened = m_State->errors.run([&] {
    const std::string url = vexa::vformat_within(vexa::kRequestRoom, format, arguments).text;
    return m_State->open_rtp_over_tcp(url, m_State->rtsp_port());
  });
  va_end(arguments);
  return opened;
}

int CVexaCommon::rtp_over_tcp_header_recv(int socket, char* buffer, int size, int timeout) {
  vexa::Operation operation(*m_State, __func__);
  m_State->errors.clear();
  return m_State->errors.run(
      [&] { return vexa::receive_rtsp_answer(socket, vexa::room_of(buffer, size), m_State->limit(timeout)); });
}

bool CVexaCommon::parse_clock(const char* text) {
  return text != nullptr && vexa::take_range_clock(text, m_State->stream_clock());
}

void CVexaCommon::KeepAlive() {
  vexa::Operation operation(*m_State, __func__);
  m_State->begin_keep_alive();
  m_State->finish_keep_alive();
}

bool CVexaCommon::InitEdgeStorageKeepAlivePeriod() {
  vexa::Operation operation(*m_State, __func__);
  if (m_State->camera.send("/command/camera.cgi?RTSPTimeout=60") != LIBD_OK) return false;
  if (m_State->camera.send("/command/edgestorage.cgi?EsRTSPRec1Timeout=60") != LIBD_OK) return false;
  return m_State->errors.run([&]() -> vexa::Result<bool> {
    std::string answer;
    if (m_State->camera.inquire("edgestorage", answer) != LIBD_OK) return false;
    int period = 0;
    if (GetUrlParameter(answer, "EsRTSPRec1Timeout=", period) && period != 0) m_KeepAlivePeriod = period;
    return true;
  });
}

void CVexaCommon::rtp_over_udp_close() {
  vexa::Operation operation(*m_State, __func__);
  if (m_RtspSocket == -1 && m_State->stream_socket() == -1) return;
  // Kept: the host's switch for recordings holds for live sessions too.
  if (m_State->wants_teardown()) {
    m_State->finish_keep_alive();  // its answer is not taken for that of the TEARDOWN
    m_State->errors.clear();
    m_State->errors.run([&]() -> vexa::Outcome {
      const auto ended = m_State->session().tear_down(m_RtspSocket, m_State->limit(m_State->teardown_timeout));
      m_State->exchanges.rtsp(1, ended ? nullptr : &ended.failure());
      if (!ended) return ended.failure();
      return LIBD_OK;
    });
  }
  rtp_stream_socket_close_all();
}

void CVexaCommon::rtp_over_tcp_close(int socket) { vexa::shutdown_and_close(socket); }

void CVexaCommon::rtp_stream_socket_close_all() {
  m_State->keep_alive.reset();
  vexa::shutdown_and_close(std::exchange(m_RtspSocket, -1));
  m_State->close_media();
}

unsigned char* CVexaCommon::base64Decode(const char* text, unsigned int& size, bool trim) {
  std::vector<unsigned char> bytes = vexa::base64_decode(text == nullptr ? "" : text);
  while (trim && !bytes.empty() && bytes.back() == 0) bytes.pop_back();
  size = static_cast<unsigned int>(bytes.size());
  auto* copy = new unsigned char[bytes.size()];
  std::copy(bytes.begin(), bytes.end(), copy);
  return copy;
}

int CVexaCommon::rtp_over_tcp_recvn(int socket, char* buffer, int length, int timeout) {
  vexa::Operation operation(*m_State, __func__);
  m_State->errors.clear();
  return m_State->errors.run([&]() -> vexa::Result<int> {
    const auto read = vexa::receive_exactly(socket, vexa::room_of(buffer, length), timeout);
    if (!read) return read.failure();
    return 0;
  });
}

int CVexaCommon::rtp_over_tcp_payload_recv(int socket, char* buffer, int size, bool* marker, unsigned char* payloadType,
                                           int timeout, unsigned int* timestamp) {
  vexa::Operation operation(*m_State, __func__);
  m_State->errors.clear();
  return m_State->errors.run([&]() -> vexa::Result<int> {
    const auto packet = vexa::receive_interleaved(socket, vexa::room_of(buffer, size), timeout);
    if (packet && *packet) m_State->take_interleaved(**packet, buffer);
    if (!packet || !*packet) m_State->ledger.publish();
    if (!packet) return packet.failure();
    if (!*packet) return 0;
    const vexa::RtpHeader& header = (*packet)->header;
    if (marker != nullptr) *marker = header.marker;
    if (payloadType != nullptr) *payloadType = header.payload_type;
    if (timestamp != nullptr) *timestamp = header.timestamp;
    return (*packet)->length;
  });
}

int CVexaCommon::rtp_over_udp_recvn(int socket, char* buffer, int length, int timeout) {
  return m_State->errors.run([&] {
    return vexa::receive_datagram({socket, m_State->stream_source().stop}, vexa::room_of(buffer, length), timeout, {});
  });
}

int CVexaCommon::rtp_over_udp_payload_recv(int socket, char* buffer, int size, int timeout, SPacketInfo& packet) {
  m_State->errors.clear();
  return m_State->errors.run([&] {
    const vexa::StoppableSocket source{socket, m_State->stream_source().stop};
    const auto length =
        vexa::receive_packet(source, vexa::room_of(buffer, size), timeout, {.observer = &m_State->ledger}, packet);
    if (!length) return length;
    const auto count = static_cast<std::size_t>(*length);
    m_State->count_passed_on(count, vexa::parse_rtp_header({reinterpret_cast<unsigned char*>(buffer), count}));
    return length;
  });
}

int CVexaCommon::rtp_over_udp_payload_recv_h264(int socket, char* buffer, int size, int timeout, SPacketInfo& packet) {
  return rtp_over_udp_payload_recv(socket, buffer, size, timeout, packet);
}

int CVexaCommon::rtp_over_udp_payload_recv(int socket, char* buffer, int size, bool* marker, unsigned char* payloadType,
                                           int timeout, unsigned int* timestamp, unsigned short* sequence) {
  SPacketInfo packet;
  const int length = rtp_over_udp_payload_recv(socket, buffer, size, timeout, packet);
  if (length < static_cast<int>(vexa::kRtpHeaderSize)) return length;
  if (marker != nullptr) *marker = packet.marker;
  if (payloadType != nullptr) *payloadType = packet.payloadType;
  if (timestamp != nullptr) *timestamp = packet.timestamp;
  if (sequence != nullptr) *sequence = packet.sequence;
  const int payload = length - static_cast<int>(vexa::kRtpHeaderSize);
  std::memmove(buffer, buffer + vexa::kRtpHeaderSize, static_cast<std::size_t>(payload));
  return payload;
}
