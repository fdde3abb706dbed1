// SPDX-License-Identifier: Apache-2.0
#include "device/camera_link.h"

#include <cstdarg>
#include <cstdio>
#include <utility>

#include "device/operation.h"
#include "runtime/base/result.h"
#include "runtime/base/text.h"
#include "transport/failure.h"
#include "transport/wire/http_request.h"
#include "vexa/real_time.h"

namespace vexa {

RaisedTimeout::RaisedTimeout(int& timeout, int& saved, CSimpleLock& lock, int milliseconds)
    : lock_(lock), timeout_(timeout), restored_([&] {
        const Guard guard(lock);
        timeout = milliseconds;
        return saved;
      }()) {}

RaisedTimeout::~RaisedTimeout() {
  const Guard guard(lock_);
  timeout_ = restored_;
}

PrivateConnection Connection::copy() {
  const Guard guard(lock_);
  return info_;
}

int Connection::timeout() {
  const Guard guard(lock_);
  return info_.timeout;
}

void Connection::write_name(std::span<char> room) {
  const Guard guard(lock_);
  std::snprintf(room.data(), room.size(), "%s:%d", info_.host.c_str(), info_.port);
}

RaisedTimeout Connection::raised(int milliseconds) {
  const Guard guard(lock_);
  return {info_.timeout, saved_timeout_, lock_, milliseconds};
}

void CgiLog::write(const char* direction, const char* message) {
  const bool request = *direction == 'T';
  if (request) Operation::announce(recorder_);
  recorder_.note(request ? "http >" : "http <", message);
  if (enabled_) enter(direction, message);
}

// A line begins with its line break, so that the file ends without one.
//
// An exchange does not fail for its log: what the camera was asked is done all the same. A line that memory is too
// short for is missing.
void CgiLog::enter(const char* direction, const char* message) {
  (void)within_memory([&] {
    std::string line = CRealTime::GetTheCurrentTime().Format("\r\n%D-%O-%Y\t%H:%M:%S.%03L\t", false);
    line.append("CGI\t").append(direction).append("\t").append(message);
    file_.Log(line.c_str());
  });
}

HttpPeer CameraLink::peer() { return {connection_.copy(), log_, Operation::cancels_of(errors_)}; }

Result<Socket> CameraLink::open(const std::string& path) {
  errors_.clear();
  auto socket = open_http(peer(), path);
  if (!socket) log_.note_failure(socket.failure());
  exchanges_.http(1, socket ? nullptr : &socket.failure());
  return socket;
}

ELibDReturnCode CameraLink::send(const char* format, ...) {
  va_list arguments;
  va_start(arguments, format);
  const ELibDReturnCode sent = errors_.run([&]() -> Outcome {
    auto socket = open(vformat_within(kRequestRoom, format, arguments).text);
    if (!socket) return socket.failure();
    shutdown_and_close(socket->release());
    return LIBD_OK;
  });
  va_end(arguments);
  return sent;
}

ELibDReturnCode CameraLink::inquire(const std::string& name, std::string& answer) {
  errors_.clear();
  return errors_.run([&]() -> Outcome {
    const auto size = inquiry_sizes_.find(name);
    if (size == inquiry_sizes_.end()) return LIBD_FAILED;
    auto received = vexa::inquire(peer(), name, size->second);
    exchanges_.http(1, received ? nullptr : &received.failure());
    if (!received) {
      log_.note_failure(received.failure());
      return received.failure();
    }
    log_.note_body(*received);
    answer = std::move(*received);
    return LIBD_OK;
  });
}

}  // namespace vexa
