// Which streams of a driver have something for its host, and who waits for them.
#pragma once

#include <condition_variable>
#include <memory>
#include <vector>

#include "device/wait_group.h"

namespace vexa {

/// The driver's streams report here what changes, under the locks of theirs that guard it. Who waits is woken from
/// here: threads, the one that polls the descriptor, wait groups.
///
/// Any thread. Its lock is taken with those of the frame queue and of a polled stream held, and only a wait group's
/// after it; a socket of a polled stream is looked at under it, without waiting, so that none is closed meanwhile.
class Readiness {
 public:
  /// `now` is read whenever the time matters.
  Readiness(CVexaCommon* driver, const SecondsClock& now) : driver_(driver), now_(now) {}
  Readiness(const Readiness&) = delete;
  Readiness& operator=(const Readiness&) = delete;
  ~Readiness();

  void set_video(bool ready);

  /// A polled stream was opened; it is ready from the second `due` on, whatever comes.
  void opened(StreamBits stream, int socket, std::int64_t due);
  /// It is about to be closed.
  void closed(StreamBits stream);
  /// It was polled: whether with data, and from when on it is ready without.
  void polled(StreamBits stream, int socket, std::int64_t due, bool data);

  std::uint32_t ready(std::uint32_t wanted);
  bool wait_for_video(int milliseconds);
  /// As VideoFrameDescriptor.
  int video_descriptor();

  /// As WaitSet's Add and Remove.
  bool join(const std::shared_ptr<WaitGroup>& group, std::uint32_t wanted);
  void leave(const WaitGroup& group);

 private:
  struct Membership {
    std::shared_ptr<WaitGroup> group;
    WaitGroup::Key key;
  };

  void set_polled(std::size_t stream, const PolledState& state) VEXA_REQUIRES(lock_);
  bool is_ready(const PolledState& state) const;

  CVexaCommon* driver_;
  const SecondsClock& now_;
  CSimpleLock lock_;
  bool video_ VEXA_GUARDED_BY(lock_) = false;
  LevelEvent video_event_ VEXA_GUARDED_BY(lock_);
  int waiters_ VEXA_GUARDED_BY(lock_) = 0;
  std::condition_variable_any video_changed_;
  PolledState polled_[kPolledCount] VEXA_GUARDED_BY(lock_) = {};
  std::vector<Membership> memberships_ VEXA_GUARDED_BY(lock_);
};

}  // namespace vexa
