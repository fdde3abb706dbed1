// The streams of several drivers that a host waits for by one descriptor.
#pragma once

#include <cstdint>
#include <ctime>
#include <limits>
#include <map>
#include <vector>

#include "runtime/base/sync.h"
#include "runtime/level_event.h"
#include "transport/socket.h"
#include "vexa/waiting.h"

namespace vexa {

/// The time of day in whole seconds; tests put their own in its place.
using SecondsClock = std::time_t (*)();

/// A second that never comes.
inline constexpr std::int64_t kNever = std::numeric_limits<std::int64_t>::max();

/// How a polled stream stands, for those who wait for it.
struct PolledState {
  int socket = -1;            ///< the stream's; -1: closed, and never ready
  std::int64_t due = kNever;  ///< second of the day clock from which the stream is ready without data
  bool resting = false;       ///< what waits on the socket has given no data: only `due` counts
};

/// The polled streams, in the order of their bits.
inline constexpr std::uint32_t kPolledStreams[] = {kAlarmStream, kMetadataStream, kAudioStream};
inline constexpr std::size_t kPolledCount = 3;

/// What to return when the system has refused a descriptor.
WaitingFailure waiting_failure(int error);

/// The inside of a WaitSet. Drivers report to it what changes, and never wait for it; it calls no driver. Drivers whose
/// video is ready stand in a list, by one event for all; connections of polled streams are watched by epoll itself; one
/// timer stands at the earliest second at which a polled stream falls due.
///
/// Any thread. Its lock is taken last of all.
class WaitGroup {
 public:
  using Key = std::uint64_t;  ///< one membership; 0: none

  WaitGroup() = default;
  WaitGroup(const WaitGroup&) = delete;
  WaitGroup& operator=(const WaitGroup&) = delete;

  int descriptor();
  int wait(std::vector<ReadyDriver>& ready, int milliseconds);

  /// A new member of which nothing is ready yet; 0 when memory or descriptors have run out.
  Key join(CVexaCommon* driver, const SecondsClock& now, std::uint32_t wanted);
  void leave(Key key);
  void want(Key key, std::uint32_t wanted);
  void set_video(Key key, bool ready);
  void set_polled(Key key, std::size_t stream, const PolledState& state);
  /// The set is gone: its descriptors are closed, its members are forgotten.
  void close();
  bool is_closed();

 private:
  struct Member {
    CVexaCommon* driver;
    const SecondsClock* now;
    std::uint32_t wanted;
    bool video = false;
    PolledState polled[kPolledCount] = {};
    int watched[kPolledCount] = {-1, -1, -1};  ///< sockets that epoll watches for it
    std::size_t place = 0;                     ///< where it stands in the latest answer, if it does
  };

  bool open() VEXA_REQUIRES(lock_);
  void list_video(Key key, const Member& member) VEXA_REQUIRES(lock_);
  void watch(Key key, Member& member, std::size_t stream) VEXA_REQUIRES(lock_);
  void bring_timer_forward(const Member& member) VEXA_REQUIRES(lock_);
  void set_timer(std::int64_t due) VEXA_REQUIRES(lock_);
  void collect(std::uint64_t event, std::vector<ReadyDriver>& ready) VEXA_REQUIRES(lock_);
  void collect_due(std::vector<ReadyDriver>& ready) VEXA_REQUIRES(lock_);

  CSimpleLock lock_;
  Socket epoll_ VEXA_GUARDED_BY(lock_);
  Socket timer_ VEXA_GUARDED_BY(lock_);
  LevelEvent video_ VEXA_GUARDED_BY(lock_);  ///< raised while video_ready_ is not empty
  std::map<Key, Member> members_ VEXA_GUARDED_BY(lock_);
  std::vector<Key> video_ready_ VEXA_GUARDED_BY(lock_);  ///< has room for all members
  Key last_key_ VEXA_GUARDED_BY(lock_) = 0;
  std::int64_t timer_at_ VEXA_GUARDED_BY(lock_) = kNever;
  bool closed_ VEXA_GUARDED_BY(lock_) = false;
};

}  // namespace vexa
