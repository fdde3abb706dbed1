// HTTP/1.0 requests, each over a connection of its own.
#include <sys/socket.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstring>
#include <new>
#include <thread>
#include <vector>

#include "runtime/base/base64.h"
#include "runtime/base/text.h"
#include "transport/failure.h"
#include "transport/socket.h"
#include "transport/tcp_connect.h"
#include "transport/wait_budget.h"
#include "transport/wire/cgi_answer.h"
#include "transport/wire/http_answer.h"
#include "transport/wire/http_request.h"
#include "vexa/vexa_common.h"

namespace {

constexpr int kReceiveBuffer = 131072;
constexpr int kHeaderRoom = 1023;
constexpr int kHeaderPause = 10;  // milliseconds between two looks at a header that is not complete
constexpr std::size_t kPieceRoom = 4096;
constexpr std::size_t kEndlessAnswer = std::size_t{32} << 20;
constexpr const char* kSparedInUrls = "$-_.+!*'(),/?&#=";

constexpr int kStatusOk = 200;
constexpr int kStatusNoContent = 204;
constexpr int kStatusUnauthorized = 401;

// Safe: a camera that sends the credentials back in its reason phrase does not put them into the log.
std::string loggable(const std::string& reason, const SLibDConnectionInfo& info) {
  if (info.password.empty()) return reason;
  const std::string as_sent = vexa::base64_encode(vexa::joined_credentials(info.userName, info.password));
  return vexa::masked(vexa::masked(reason, as_sent), info.password);
}

void pause_before_next_look() { std::this_thread::sleep_for(std::chrono::milliseconds(kHeaderPause)); }

}  // namespace

// Safe: an exchange that memory does not hold is a failure and not an exception.
int CVexaCommon::http_open(const char* format, ...) try {
  ClearLatestError();
  va_list arguments;
  va_start(arguments, format);
  const std::string path = vexa::vformat_within(vexa::kRequestRoom, format, arguments).text;
  va_end(arguments);
  const SLibDConnectionInfo info = ConnectionInfo();
  vexa::Socket socket(ConnectHttp(info));
  if (!socket.valid() || !RequestHttp(socket.get(), info, path)) return -1;
  if (!ReadHttpStatus(socket.get(), info.timeout)) return -1;
  if (!vexa::make_nonblocking(socket.get())) return FailSystem();
  return socket.release();
} catch (const std::bad_alloc&) {
  return FailSystem(ENOMEM);
}

int CVexaCommon::ConnectHttp(const SLibDConnectionInfo& info) {
  const vexa::ResolvedHost host =
      info.useProxy ? vexa::resolve_host(info.proxyHost, info.proxyPort) : vexa::resolve_host(info.host, info.port);
  // Kept: the resolver's number is shown as a system error; hosts know the texts that this gives.
  if (!host.address) return FailSystem(host.error);
  vexa::Socket socket = vexa::make_socket(SOCK_STREAM);
  if (!socket.valid() || !vexa::set_receive_buffer(socket.get(), kReceiveBuffer)) return FailSystem();
  if (!vexa::make_nonblocking(socket.get())) return FailSystem();
  const int connected = vexa::connect_within(socket.get(), *host.address, info.timeout);
  if (connected != 1) return FailWait(connected, vexa::kConnectTimedOut);
  if (!vexa::make_blocking(socket.get())) return FailSystem();
  return socket.release();
}

bool CVexaCommon::RequestHttp(int socket, const SLibDConnectionInfo& info, const std::string& path) {
  const std::string credentials = vexa::base64_encode(vexa::joined_credentials(info.userName, info.password));
  const vexa::Formatted request = vexa::http_get_request({info.host, info.port, path, credentials});
  if (request.cut) {
    Fail(vexa::kUrlTooLong);
    return false;
  }
  if (m_CGILogEnabled) Log("To", path.c_str());
  if (vexa::send_once(socket, request.text.data(), request.text.size())) return true;
  FailSystem();
  return false;
}

bool CVexaCommon::ReadHttpStatus(int socket, int timeout) {
  char header[kHeaderRoom + 1];
  const int length = http_header_recv(socket, header, kHeaderRoom, timeout);
  if (length < 1) return false;
  const auto line = vexa::parse_status_line({header, static_cast<std::size_t>(length)}, "HTTP/");
  if (!line) {
    Fail(vexa::kStatusNotFound);
    return false;
  }
  if (m_CGILogEnabled) {
    const std::string reason = loggable(line->reason, ConnectionInfo());
    Log("From", vexa::format_within(kHeaderRoom, "%d %s", line->status, reason.c_str()).text.c_str());
  }
  if (line->status == kStatusOk || line->status == kStatusNoContent) return true;
  Fail({line->status == kStatusUnauthorized ? LIBD_UNAUTHORIZED : LIBD_FAILED, line->reason.c_str()});
  return false;
}

// Takes the header off the socket and nothing else: the body stays for its reader.
int CVexaCommon::http_header_recv(int socket, char* buffer, int length, int timeout) {
  ClearLatestError();
  const int ready = vexa::WaitBudget(timeout).wait_readable(socket);
  if (ready == 0) return 0;
  if (ready != 1) return FailWait(ready, vexa::kReceiveTimedOut);
  const std::size_t room = static_cast<std::size_t>(std::max(length, 0));
  for (int looks_left = timeout / kHeaderPause;; --looks_left) {
    const ssize_t peeked = recv(socket, buffer, room, MSG_PEEK);
    if (peeked < 0) return FailSystem();
    const std::size_t header = vexa::header_length({buffer, static_cast<std::size_t>(peeked)});
    if (header != 0) return recv(socket, buffer, header, 0) < 0 ? FailSystem() : static_cast<int>(header);
    if (looks_left <= 0) return 0;
    pause_before_next_look();
  }
}

int CVexaCommon::http_recv(int socket, char* buffer, int length, int timeout) {
  ClearLatestError();
  const int ready = vexa::WaitBudget(timeout).wait_readable(socket);
  if (ready == 0) return 0;
  if (ready != 1) return FailWait(ready, vexa::kReceiveTimedOut);
  const ssize_t received = recv(socket, buffer, static_cast<std::size_t>(std::max(length, 0)), 0);
  return received < 0 ? FailSystem() : static_cast<int>(received);
}

int CVexaCommon::http_recvn(int socket, char* buffer, int length, int timeout) {
  ClearLatestError();
  const vexa::WaitBudget budget(timeout);
  int filled = 0;
  while (filled < length) {
    const int ready = budget.wait_readable(socket);
    if (ready != 1) return FailWait(ready, vexa::kReceiveTimedOut);
    const ssize_t received = recv(socket, buffer + filled, static_cast<std::size_t>(length - filled), 0);
    if (received < 0) return FailSystem();
    if (received == 0) return filled;
    filled += static_cast<int>(received);
  }
  return filled;
}

int CVexaCommon::http_recvn(int socket, std::string& text, int length, int timeout) {
  ClearLatestError();
  const vexa::WaitBudget budget(timeout);
  const bool until_closed = length <= 0;
  std::vector<char> piece(until_closed ? kPieceRoom : static_cast<std::size_t>(length));
  for (std::int64_t missing = length;;) {
    const int ready = budget.wait_readable(socket);
    if (ready != 1) return FailWait(ready, vexa::kReceiveTimedOut);
    const ssize_t received = recv(socket, piece.data(), piece.size(), 0);
    if (received < 0) return FailSystem();
    text.append(piece.data(), static_cast<std::size_t>(received));
    // Kept: only a read of exactly what is missing ends a bounded read. Each read asks for the whole length, since an
    // answer comes in one piece and the camera closes behind it.
    if (received == 0 || (!until_closed && received == missing)) return static_cast<int>(text.size());
    missing -= received;
    // Safe: a camera that never stops sending does not fill the memory.
    if (text.size() > kEndlessAnswer) return Fail(vexa::kReceiveTimedOut);
  }
}

void CVexaCommon::http_close(int socket) { vexa::shutdown_and_close(socket); }

std::string CVexaCommon::AddUrlEncoding(const std::string& text, bool encodeAll) {
  return vexa::percent_encoded(text, encodeAll ? "" : kSparedInUrls);
}

// NOLINTNEXTLINE(performance-unnecessary-value-param): model classes are linked to this signature.
bool CVexaCommon::GetUrlParameter(const std::string& answer, std::string key, std::string& value) {
  const auto found = vexa::cgi_value(answer, key);
  if (!found) return false;
  value = std::string(*found);
  return !value.empty();
}

bool CVexaCommon::GetUrlParameter(const std::string& answer, std::string key, int& value) {
  std::string text;
  if (!GetUrlParameter(answer, std::move(key), text)) return false;
  value = vexa::leading_int(text);
  return true;
}

// Safe: an answer that memory does not hold is a failure and not an exception.
ELibDReturnCode CVexaCommon::SendInqCommand(const std::string& name, std::string& answer) try {
  ClearLatestError();
  const auto size = m_InquirySizes.find(name);
  if (size == m_InquirySizes.end()) return LIBD_FAILED;
  std::vector<char> bytes(static_cast<std::size_t>(size->second) + 1);
  const int socket = http_open("/command/inquiry.cgi?inq=%s", name.c_str());
  if (socket == -1) return LIBD_FAILED;
  const int received = http_recvn(socket, bytes.data(), size->second, ConnectionTimeout());
  http_close(socket);
  if (received < 0) return LIBD_FAILED;
  answer = bytes.data();
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

// Safe: a path that memory does not hold is a failure and not an exception; the driver's end sends a command too.
ELibDReturnCode CVexaCommon::SendCommand(const char* format, ...) {
  std::string path;
  va_list arguments;
  va_start(arguments, format);
  bool written = true;
  try {
    path = vexa::vformat_within(vexa::kRequestRoom, format, arguments).text;
  } catch (const std::bad_alloc&) {
    written = false;
  }
  va_end(arguments);
  if (!written) {
    ClearLatestError();
    FailSystem(ENOMEM);
    return LIBD_FAILED;
  }
  const int socket = http_open("%s", path.c_str());
  if (socket == -1) return LatestErrorCode();
  http_close(socket);
  return LIBD_OK;
}

void CVexaCommon::base64Encode(const char* text, char* output) {
  const std::string encoded = vexa::base64_encode(text);
  std::memcpy(output, encoded.c_str(), encoded.size() + 1);
}
