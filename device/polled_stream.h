// The streams that the host polls: sound, alarms, motion metadata.
#pragma once

#include <cstdint>
#include <ctime>
#include <utility>

#include "device/error_record.h"
#include "runtime/base/sync.h"
#include "transport/socket.h"

namespace vexa {

/// Whether a stream without data since `last` counts as dead: after more than `patience` milliseconds.
inline bool is_silent(std::time_t now, std::time_t last, std::int64_t patience) {
  return (std::int64_t{now} - std::int64_t{last}) * 1000 > patience;
}

/// Milliseconds without the fraction of a second, by which silences are measured.
inline std::int64_t whole_seconds(int milliseconds) { return std::int64_t{milliseconds / 1000} * 1000; }

/// One of the driver's polled streams; socket and time are fields of the driver. Any thread. A poll holds the stream's
/// lock while it waits for data; a start or stop waits for the lock in turn, so that it is next however soon polls
/// follow each other. Has no thread of its own.
class PolledStream {
 public:
  PolledStream(CSimpleLock& lock, int& socket, std::time_t& last) : lock_(lock), socket_(socket), last_(last) {}

  /// Opens the stream by `open`, which returns a Result<Socket>, and counts its silence from `now()` on. Closes the
  /// stream that another thread may have opened meanwhile.
  template <typename Open, typename Now>
  Outcome start(Open&& open, Now&& now) {
    const TurnGuard guard(lock_, turn_);
    shutdown_and_close(std::exchange(socket_, -1));
    auto opened = std::forward<Open>(open)();
    if (!opened) return opened.failure();
    socket_ = opened->release();
    last_ = now();
    return LIBD_OK;
  }

  /// Closes the stream: whether it was open.
  bool stop() {
    const TurnGuard guard(lock_, turn_);
    const int socket = std::exchange(socket_, -1);
    shutdown_and_close(socket);
    return socket != -1;
  }

  /// Reads by `read`, which takes the socket and returns a Result<int>, 0 when no data came: LIBD_OK when some did,
  /// else LIBD_TIMEOUT once the stream has been silent for `patience` milliseconds and LIBD_NO_FRAME before.
  /// LIBD_FAILED, without a read, when it is closed.
  template <typename Read, typename Now>
  Outcome poll(Read&& read, Now&& now, std::int64_t patience) {
    const TurnGuard guard(lock_, turn_);
    if (socket_ == -1) return LIBD_FAILED;
    const auto received = std::forward<Read>(read)(socket_);
    if (!received) return received.failure();
    const std::time_t then = now();
    if (*received == 0) return is_silent(then, last_, patience) ? LIBD_TIMEOUT : LIBD_NO_FRAME;
    last_ = then;
    return LIBD_OK;
  }

  /// For work of its own under the stream's lock.
  CSimpleLock& turn() { return turn_; }

 private:
  CSimpleLock& lock_;
  CSimpleLock turn_;
  int& socket_ VEXA_GUARDED_BY(lock_);
  std::time_t& last_ VEXA_GUARDED_BY(lock_);
};

}  // namespace vexa
