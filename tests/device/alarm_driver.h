// SPDX-License-Identifier: Apache-2.0
// The driver with its alarm, detection and metadata members in reach and a clock that the test sets, and a camera that
// answers every request while its streams stay open.
#pragma once

#include <gtest/gtest.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <atomic>
#include <ctime>
#include <functional>
#include <map>
#include <mutex>
#include <string>
#include <string_view>
#include <thread>
#include <utility>
#include <vector>

#include "tests/device/settings_exchange.h"
#include "tests/support/stream_pair.h"

namespace vexa_test {

inline std::atomic<std::time_t> alarm_clock_now{1000};

class AlarmDriver : public TestDriver {
 public:
  AlarmDriver() {
    alarm_clock_now = 1000;
    state().now = [] { return alarm_clock_now.load(); };
    soil_latest_error();
  }

  /// Takes the driver's end of `pair` for its alarm stream for as long as the test lets it.
  void read_alarms_from(const StreamPair& pair, int timeout) {
    const vexa::Guard guard(m_ConnectionLock);
    m_ConnectionInfo.timeout = m_SavedTimeout = timeout;
    m_IoStreamSocket = pair.driver_end();
    m_LastIoDataTime = alarm_clock_now;
  }
  /// Lets go of a stream that is the test's.
  void forget_streams() { m_IoStreamSocket = m_MdStreamSocket = -1; }

  int timeout() { return ConnectionTimeout(); }
};

inline std::string alarm_part(const std::string& items) { return "--part\r\n" + items + "\r\n\r\n"; }

/// What tests compare of a pin: number, type, enabled, state.
using PinRow = std::vector<int>;

inline std::vector<PinRow> rows_of(const std::vector<SLibDPinInfo>& pins) {
  std::vector<PinRow> rows;
  for (const SLibDPinInfo& pin : pins) {
    EXPECT_EQ(pin.reservedValue, 0);
    EXPECT_FALSE(pin.reservedFlag);
    rows.push_back({pin.number, pin.type, pin.enabled ? 1 : 0, pin.state});
  }
  return rows;
}

/// Answers each request of any number of connections by its path, with "204 No Content" when no answer is set. The
/// connections of its streams stay open.
class AlarmCamera {
 public:
  static constexpr char kAlarms[] = "/command/alarmdata.cgi?interval=1";
  static constexpr char kMetadata[] = "/mddata.cgi";

  AlarmCamera() {
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    listener_ = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    socklen_t size = sizeof address;
    EXPECT_EQ(bind(listener_, reinterpret_cast<sockaddr*>(&address), size), 0);
    EXPECT_EQ(listen(listener_, 64), 0);
    EXPECT_EQ(getsockname(listener_, reinterpret_cast<sockaddr*>(&address), &size), 0);
    port_ = ntohs(address.sin_port);
    EXPECT_EQ(pipe(stop_), 0);
    thread_ = std::thread([this] { serve(); });
  }
  ~AlarmCamera() {
    close(stop_[1]);
    thread_.join();
    for (const int descriptor : {stop_[0], listener_}) close(descriptor);
    for (const int stream : streams_) close(stream);
  }
  AlarmCamera(const AlarmCamera&) = delete;
  AlarmCamera& operator=(const AlarmCamera&) = delete;

  void introduce(AlarmDriver& driver, int timeout = kPatientTimeout) { driver.use("127.0.0.1", port_, timeout); }

  void set_answer(const std::string& path, const std::string& answer) {
    const std::lock_guard<std::mutex> guard(mutex_);
    answers_[path] = answer;
  }
  void set_inquiry(const std::string& name, const std::string& body) {
    set_answer("/command/inquiry.cgi?inq=" + name, "HTTP/1.0 200 OK\r\n\r\n" + body);
  }

  /// Called with the path of each request before its answer, by the camera's thread.
  void observe(std::function<void(const std::string&)> observer) {
    const std::lock_guard<std::mutex> guard(mutex_);
    observer_ = std::move(observer);
  }

  /// The paths asked for since the last time.
  std::vector<std::string> requests() {
    const std::lock_guard<std::mutex> guard(mutex_);
    return std::exchange(requests_, {});
  }

  /// Says bytes on the newest stream.
  void say(std::string_view bytes) {
    const std::lock_guard<std::mutex> guard(mutex_);
    ASSERT_FALSE(streams_.empty());
    ASSERT_EQ(send(streams_.back(), bytes.data(), bytes.size(), MSG_NOSIGNAL), static_cast<ssize_t>(bytes.size()));
  }
  /// Says bytes on every stream that takes them.
  void chatter(std::string_view bytes) {
    const std::lock_guard<std::mutex> guard(mutex_);
    for (const int stream : streams_) send(stream, bytes.data(), bytes.size(), MSG_NOSIGNAL | MSG_DONTWAIT);
  }
  /// Ends the newest stream.
  void hang_up() {
    const std::lock_guard<std::mutex> guard(mutex_);
    ASSERT_FALSE(streams_.empty());
    shutdown(streams_.back(), SHUT_RDWR);
  }
  /// How many streams the driver has closed, once it has closed `count`.
  std::size_t closed_streams(std::size_t count) {
    std::size_t closed = 0;
    const std::lock_guard<std::mutex> guard(mutex_);
    for (const int stream : streams_) {
      pollfd entry{stream, POLLIN, 0};
      if (closed < count && poll(&entry, 1, kPatientTimeout) == 1) ++closed;
    }
    return closed;
  }
  std::size_t opened_streams() {
    const std::lock_guard<std::mutex> guard(mutex_);
    return streams_.size();
  }

 private:
  void serve() {
    for (;;) {
      pollfd entries[] = {{listener_, POLLIN, 0}, {stop_[0], POLLIN, 0}};
      poll(entries, 2, -1);
      if (entries[1].revents != 0) return;
      answer(accept4(listener_, nullptr, nullptr, SOCK_CLOEXEC));
    }
  }

  void answer(int connection) {
    std::string heard;
    while (heard.find("\r\n\r\n") == std::string::npos) {
      char piece[2048];
      const ssize_t got = recv(connection, piece, sizeof piece, 0);
      if (got <= 0) break;
      heard.append(piece, static_cast<std::size_t>(got));
    }
    const std::string url = heard.substr(0, heard.rfind(" HTTP/1.0"));
    const std::size_t begin = url.find('/', url.find("://") + 3);
    const std::string path = begin == std::string::npos ? std::string() : url.substr(begin);
    const std::lock_guard<std::mutex> guard(mutex_);
    requests_.push_back(path);
    if (observer_) observer_(path);
    const auto set = answers_.find(path);
    const std::string said = set != answers_.end() ? set->second : "HTTP/1.0 204 No Content\r\n\r\n";
    if (!said.empty()) send(connection, said.data(), said.size(), MSG_NOSIGNAL);
    const bool stream = (path == kAlarms || path == kMetadata) && said.find(" 204 ") != std::string::npos;
    if (stream) {
      streams_.push_back(connection);
    } else {
      close(connection);
    }
  }

  int listener_ = -1;
  int port_ = 0;
  int stop_[2] = {-1, -1};
  std::mutex mutex_;
  std::map<std::string, std::string> answers_;
  std::vector<std::string> requests_;
  std::function<void(const std::string&)> observer_;
  std::vector<int> streams_;
  std::thread thread_;
};

}  // namespace vexa_test
