// SPDX-License-Identifier: Apache-2.0
#include "transport/rtsp_session.h"

#include <sys/socket.h>

#include <algorithm>
#include <chrono>
#include <cstring>
#include <utility>

#include "runtime/base/deadline.h"
#include "runtime/base/wipe.h"
#include "transport/failure.h"
#include "transport/tcp_connect.h"
#include "transport/wire/http_answer.h"
#include "transport/wire/http_request.h"
#include "transport/wire/rtsp_answer.h"
#include "transport/wire/rtsp_request.h"

namespace vexa {
namespace {

using Clock = std::chrono::steady_clock;

constexpr int kMediaReceiveBuffer = 524288;
constexpr int kSharedReceiveBuffer = 131072;  // of a connection that carries media too
constexpr int kAnswerRoom = 1023;
constexpr int kMillisecondsPerSecond = 1000;
constexpr std::chrono::milliseconds kKeepAliveAnswerTimeout{1000};

constexpr int kRtspOk = 200;
constexpr int kRtspUnauthorized = 401;

/// A non-blocking socket whose single reads and sends end after whole seconds of the time-out; invalid with errno.
Socket make_control_socket(int timeout) {
  Socket control = make_socket(SOCK_STREAM);
  if (!control.valid() || !make_nonblocking(control.get())) return {};
  const timeval limit{timeout / kMillisecondsPerSecond, 0};
  setsockopt(control.get(), SOL_SOCKET, SO_RCVTIMEO, &limit, sizeof limit);
  setsockopt(control.get(), SOL_SOCKET, SO_SNDTIMEO, &limit, sizeof limit);
  return control;
}

Result<> connect_rtsp(const RtspServer& server, WaitLimit limit) {
  const int connected = connect_within(server.socket.get(), server.address, limit);
  if (connected != 1) return wait_failure(connected, kConnectTimedOut);
  if (!make_blocking(server.socket.get())) return system_failure();
  return {};
}

Result<std::string> receive_accepted(int socket, WaitLimit limit) {
  char text[kAnswerRoom];
  const auto length = receive_rtsp_answer(socket, text, limit);
  if (!length) return length.failure();
  std::string answer(text, static_cast<std::size_t>(*length));
  const auto line = parse_status_line(answer, "RTSP/");
  if (!line) return kStatusNotFound;
  if (line->status == kRtspOk) return answer;
  return Failure{line->status == kRtspUnauthorized ? LIBD_UNAUTHORIZED : LIBD_FAILED, line->reason};
}

/// As receive_rtsp_answer of one look, in steps that do not wait: what came of it, none while it is not known.
std::optional<Result<>> take_keep_alive_answer(int socket, AwaitedAnswer& awaited) {
  const bool too_late = Clock::now() >= awaited.give_up;
  if (awaited.begun) {
    if (!too_late && WaitBudget(0).wait_closed(socket) == 0) return std::nullopt;
    return kReceiveTimedOut;
  }
  const int ready = WaitBudget(0).wait_readable(socket);
  if (ready < 0) return system_failure();
  if (ready == 0 && !too_late) return std::nullopt;
  if (ready == 0) return kReceiveTimedOut;
  char room[kAnswerRoom];
  const ssize_t peeked = recv(socket, room, sizeof room, MSG_PEEK);
  if (peeked < 0) return system_failure();
  const auto length = static_cast<std::size_t>(peeked);
  if (!rtsp_header_complete({room, length}, 0)) {
    awaited.begun = true;
    awaited.give_up = Clock::now() + kKeepAliveAnswerTimeout;
    return std::nullopt;
  }
  if (recv(socket, room + length, sizeof room - length, 0) < 0) return system_failure();
  return Result<>();
}

Result<int> clock_rate_of(const std::string& description) {
  const RtpClock clock = rtp_clock(description);
  switch (clock.found) {
    case RtpClock::Found::kRate:
      return clock.rate;
    case RtpClock::Found::kNoRtpmap:
      return kRtpmapNotFound;
    case RtpClock::Found::kNoSlash:
      return kRtpmapSlashNotFound;
    case RtpClock::Found::kNoNumber:
      return kClockUnitNotFound;
  }
  return kNoReason;
}

}  // namespace

bool take_range_clock(std::string_view text, StreamClock clock) {
  const RangeClock read = parse_range_clock(text);
  if (read.seconds) clock.range_seconds = *read.seconds;
  if (read.understood) clock.range_micros = read.micros;
  return read.understood;
}

// Kept: each peek is appended to the one before, and the answer is read after the last peek, as far as there is room.
// An answer that comes in one piece and fills no more than half the buffer is whole at the buffer's beginning; of a
// longer one, or one that came in pieces, only a part is seen.
Result<int> receive_rtsp_answer(int socket, std::span<char> room, WaitLimit limit) {
  const int ready = WaitBudget(limit).wait_readable(socket);
  if (ready != 1) return wait_failure(ready, kReceiveTimedOut);
  // Safe: no byte that was in the buffer before is taken for the camera's.
  std::fill(room.begin(), room.end(), '\0');
  // Kept: one peek a second, for whole seconds; a time-out below a second sees no answer.
  const int looks = limit.milliseconds / kMillisecondsPerSecond;
  std::size_t filled = 0;
  int looked = 0;
  while (looked < looks) {
    const ssize_t peeked = recv(socket, room.data() + filled, room.size() - filled, MSG_PEEK);
    if (peeked < 0) return system_failure();
    const std::size_t latest = std::exchange(filled, filled + static_cast<std::size_t>(peeked));
    if (rtsp_header_complete({room.data(), filled}, latest)) break;
    ++looked;
    // The looks that are left see what is there when the peer has closed, and end soon.
    (void)WaitBudget(limit.of(kMillisecondsPerSecond)).wait_closed(socket);
  }
  if (looked == looks) return kReceiveTimedOut;
  const ssize_t received = recv(socket, room.data() + filled, room.size() - filled, 0);
  if (received < 0) return system_failure();
  return static_cast<int>(received);
}

Socket make_media_socket() { return make_socket(SOCK_DGRAM); }

Result<int> bind_media_socket(int socket) {
  set_receive_buffer(socket, kMediaReceiveBuffer);
  sockaddr_in address{};
  address.sin_family = AF_INET;
  socklen_t length = sizeof address;
  if (bind(socket, reinterpret_cast<sockaddr*>(&address), length) != 0) return system_failure();
  // Safe: reusable only once it is bound; two sessions with reusable sockets could be given the same free port.
  const int reuse = 1;
  setsockopt(socket, SOL_SOCKET, SO_REUSEADDR, &reuse, sizeof reuse);
  if (getsockname(socket, reinterpret_cast<sockaddr*>(&address), &length) != 0) return system_failure();
  return ntohs(address.sin_port);
}

// Kept: the trace shows each request whole, credentials included; support reads it from the host's console.
bool RtspSession::send(int socket, const std::string& request) {
  constexpr std::string_view kBegin = "send <";
  std::string line;
  const WipedAtEnd wiped(line);
  line.reserve(kBegin.size() + request.size() + 1);  // so that it is not copied as it grows
  line.append(kBegin).append(request).append(">");
  trace_.write(line, fields_.credentials);
  return send_once(socket, request.data(), request.size());
}

Result<std::string> RtspSession::receive(int socket, WaitLimit limit) {
  auto answer = receive_accepted(socket, limit);
  if (answer) {
    trace_.answered(*answer, fields_.credentials);
  } else {
    trace_.unanswered(answer.failure());
  }
  return answer;
}

Result<RtspServer> RtspSession::begin(const std::string& host, int port, WaitLimit limit) {
  fields_.cseq = 0;
  const ResolvedHost resolved = resolve_host(host, port, limit.cancels);
  if (limit.cancels.raised()) return kConnectTimedOut;
  if (!resolved.address) return system_failure(resolved.error);
  RtspServer server{make_control_socket(limit.milliseconds), *resolved.address};
  if (!server.socket.valid()) return system_failure();
  return server;
}

Result<int> RtspSession::open(const RtspServer& server, const Opening& opening) {
  const SLibDConnectionInfo& info = opening.connection;
  if (opening.media_port == kInterleaved) set_receive_buffer(server.socket.get(), kSharedReceiveBuffer);
  if (const auto connected = connect_rtsp(server, {info.timeout, opening.cancels}); !connected)
    return connected.failure();
  socket_ = server.socket.get();
  std::string encoded = basic_credentials(info.userName, info.password);
  const WipedAtEnd wiped(encoded);
  std::memcpy(fields_.credentials, encoded.c_str(), encoded.size() + 1);
  const RtspHead describe{opening.url, ++fields_.cseq, fields_.credentials};
  const auto description = exchange(rtsp_describe(describe), opening);
  if (!description) return description.failure();
  if (const auto taken = take_clocks(*description, opening); !taken) return taken.failure();
  auto session = set_up(opening);
  if (!session) return session;
  const RtspHead play{opening.url, ++fields_.cseq, fields_.credentials};
  const auto played = exchange(rtsp_play(play, {*session, opening.scale}), opening);
  if (!played) return played.failure();
  return session;
}

Result<std::string> RtspSession::exchange(Formatted request, const Opening& opening) {
  const WipedAtEnd wiped(request.text);
  if (request.cut) return kUrlTooLong;
  ++requests_;
  if (!send(socket_, request.text)) return system_failure();
  return receive(socket_, {opening.connection.timeout, opening.cancels});
}

Result<> RtspSession::take_clocks(const std::string& description, const Opening& opening) const {
  const auto range = range_clock_text(description);
  // Kept: over UDP a description needs no clock, as live cameras send none; inside the connection it does.
  if (!range && opening.media_port == kInterleaved) return kClockNotFound;
  if (range && !take_range_clock(*range, opening.clock)) return kUnknownClock;
  const auto rate = clock_rate_of(description);
  if (!rate) return rate.failure();
  opening.clock.rtp_rate = *rate;
  return {};
}

Result<int> RtspSession::set_up(const Opening& opening) {
  const RtspHead head{opening.url, ++fields_.cseq, fields_.credentials};
  const auto answer = exchange(
      opening.media_port == kInterleaved ? rtsp_setup_interleaved(head) : rtsp_setup_udp(head, opening.media_port),
      opening);
  if (!answer) return answer.failure();
  const auto number = session_number(*answer);
  if (!number) return kSessionNotFound;
  return *number;
}

AwaitedAnswer RtspSession::send_keep_alive(int socket) {
  const RtspHead head{fields_.url, ++fields_.cseq, fields_.credentials};
  Formatted request = rtsp_get_parameter(head, fields_.session);
  const WipedAtEnd wiped(request.text);
  const bool sent = send(socket, request.text);
  trace_.write(sent ? "successfully sending getparameter" : "error sending getparameter", fields_.credentials);
  return {Clock::now() + kKeepAliveAnswerTimeout, false, request.cut};
}

std::optional<Result<>> RtspSession::keep_alive_outcome(int socket, AwaitedAnswer& awaited) {
  auto taken = take_keep_alive_answer(socket, awaited);
  if (!taken) return std::nullopt;
  if (!*taken) {
    trace_.write("error receiving getparameter", fields_.credentials);
    return taken;
  }
  // Kept: a keep-alive that is too long is sent cut; the text of the error ends in a line break, which hosts compare.
  if (awaited.request_cut) return kKeepAliveTooLong;
  return taken;
}

Result<> RtspSession::wait_for_keep_alive(int socket, AwaitedAnswer& awaited, Cancels cancels) {
  for (;;) {
    if (cancels.raised()) awaited.give_up = {};
    if (auto outcome = keep_alive_outcome(socket, awaited)) return *std::move(outcome);
    const WaitBudget budget({milliseconds_until(awaited.give_up), cancels});
    (void)(awaited.begun ? budget.wait_closed(socket) : budget.wait_readable(socket));
  }
}

Result<> RtspSession::tear_down(int socket, WaitLimit limit) {
  const RtspHead head{fields_.url, ++fields_.cseq, fields_.credentials};
  Formatted request = rtsp_teardown(head, fields_.session);
  const WipedAtEnd wiped(request.text);
  // Kept: a text that is too long is sent cut, for the camera to refuse. The answer is read whatever came before, and
  // the last failure is the one that is reported.
  Result<> result;
  if (request.cut) result = kUrlTooLong;
  if (!send(socket, request.text)) result = system_failure();
  const auto answer = receive(socket, limit);
  if (!answer) return answer.failure();
  return result;
}

}  // namespace vexa
