// The streams that the host polls: sound, alarms, motion metadata.
#pragma once

#include <cstdint>
#include <ctime>
#include <utility>

#include "device/error_record.h"
#include "device/readiness.h"
#include "runtime/base/sync.h"
#include "transport/socket.h"

namespace vexa {

/// Whether no data since `last` mean that a stream has died: more than `patience` milliseconds.
inline bool is_silent(std::time_t now, std::time_t last, std::int64_t patience) {
  return (std::int64_t{now} - std::int64_t{last}) * 1000 > patience;
}

/// The first second in which a stream without data since `last` is silent.
inline std::int64_t silent_from(std::time_t last, std::int64_t patience) {
  const std::int64_t whole = patience / 1000 - (patience % 1000 < 0 ? 1 : 0);
  return std::int64_t{last} + whole + 1;
}

/// Milliseconds without the fraction of a second. Only below 0 does a silence tell the difference.
inline std::int64_t whole_seconds(int milliseconds) { return std::int64_t{milliseconds / 1000} * 1000; }

/// One polled stream, over fields of the driver. Any thread; a poll holds the stream's lock while it waits for data,
/// and a start or stop waits for it in turn, so that it comes next however soon polls follow each other.
class PolledStream {
 public:
  struct Fields {
    CSimpleLock& lock;
    int& socket;
    std::time_t& last;
  };
  /// Where those who wait for the stream are found.
  struct Waiters {
    Readiness& readiness;
    StreamBits stream;
  };

  PolledStream(Fields fields, Waiters waiters)
      : lock_(fields.lock), socket_(fields.socket), last_(fields.last), waiters_(waiters) {}

  /// Opens the stream by `open`, which returns a Result<Socket>, and counts its silence from `now()` on: who waits for
  /// the stream is woken after `patience` milliseconds of it. What another thread has opened meanwhile is closed.
  template <typename Open, typename Now>
  Outcome start(Open&& open, Now&& now, std::int64_t patience) {
    const TurnGuard guard(lock_, turn_);
    close();
    auto opened = std::forward<Open>(open)();
    if (!opened) return opened.failure();
    socket_ = opened->release();
    last_ = now();
    waiters_.readiness.opened(waiters_.stream, socket_, silent_from(last_, patience));
    return LIBD_OK;
  }

  /// Closes the stream: whether it was open.
  bool stop() {
    const TurnGuard guard(lock_, turn_);
    const bool was_open = socket_ != -1;
    close();
    return was_open;
  }

  /// Reads by `read`, which takes the socket and returns a Result<int>, 0 when no data came: LIBD_OK when some did,
  /// else LIBD_TIMEOUT once the stream has been silent for `patience` milliseconds and LIBD_NO_FRAME before.
  /// LIBD_FAILED, without a reading, when it is closed.
  template <typename Read, typename Now>
  Outcome poll(Read&& read, Now&& now, std::int64_t patience) {
    const TurnGuard guard(lock_, turn_);
    if (socket_ == -1) return LIBD_FAILED;
    const auto received = std::forward<Read>(read)(socket_);
    const std::time_t then = now();
    const bool data = received && *received != 0;
    const bool silent = is_silent(then, last_, patience);
    if (data) last_ = then;
    // After a report of silence, or a failure amid one, the next is due as much later.
    waiters_.readiness.polled(waiters_.stream, socket_, silent_from(silent ? then : last_, patience), data);
    if (!received) return received.failure();
    if (data) return LIBD_OK;
    return silent ? LIBD_TIMEOUT : LIBD_NO_FRAME;
  }

  /// For data that come without a reading: whether some wait for the host, or it has just taken them.
  template <typename Now>
  void note_other_data(bool waiting, Now&& now, std::int64_t patience) {
    const Guard guard(lock_);
    last_ = now();
    const std::int64_t due = waiting ? std::int64_t{last_} : silent_from(last_, patience);
    waiters_.readiness.polled(waiters_.stream, socket_, due, true);
  }

  /// For work of its own under the stream's lock.
  CSimpleLock& turn() { return turn_; }

 private:
  void close() VEXA_REQUIRES(lock_) {
    waiters_.readiness.closed(waiters_.stream);
    shutdown_and_close(std::exchange(socket_, -1));
  }

  CSimpleLock& lock_;
  CSimpleLock turn_;
  int& socket_ VEXA_GUARDED_BY(lock_);
  std::time_t& last_ VEXA_GUARDED_BY(lock_);
  Waiters waiters_;
};

}  // namespace vexa
