// SPDX-License-Identifier: Apache-2.0
// Keeps sessions going, on one thread.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <set>
#include <vector>

#include "session/link_watch.h"
#include "session/session_core.h"
#include "vexa/waiting.h"

namespace vexa {

/// Whether the calling thread runs a turn of some keeper, so that it must not wait for a session.
[[nodiscard]] bool is_keeper_thread();

/// Waits for everything that concerns its sessions on one descriptor, and gives them their turns. One thread at a time
/// runs turns; any thread adds and wakes.
class Keeper {
 public:
  explicit Keeper(GroupParts& parts);
  ~Keeper();
  Keeper(const Keeper&) = delete;
  Keeper& operator=(const Keeper&) = delete;

  /// False when the system has refused a descriptor.
  [[nodiscard]] bool is_usable() const;
  /// Readable while there is something to do.
  [[nodiscard]] int descriptor() const { return epoll_; }
  [[nodiscard]] static constexpr std::uint32_t descriptors() { return 7; }

  /// False after end(): nothing more is taken.
  [[nodiscard]] bool add(const std::shared_ptr<SessionCore>& session);
  /// A session of this keeper or of another: those of others are passed over.
  void wake(std::uint64_t number);
  void stop_all();
  /// News of a link, for all sessions.
  void note_link();
  [[nodiscard]] std::size_t size() const;

  /// Waits for something to do, at most `milliseconds`, less than 0 without limit, and does it. Returns how many
  /// callbacks were made.
  int turn(std::int32_t milliseconds, const std::function<void()>& on_link);
  /// Turns until end() and until no session is left.
  void run(const std::function<void()>& on_link);
  void end();

 private:
  using Kept = std::map<std::uint64_t, std::shared_ptr<SessionCore>>;
  /// A driver in the set, and for which streams.
  struct Watched {
    CVexaCommon* driver = nullptr;
    std::uint32_t streams = 0;
  };

  void arm(Moment deadline);
  int serve_all(bool ready);
  void rest();
  void listen(bool on);
  int serve_woken();
  int serve_due(Moment now);
  int serve_ready();
  int serve(SessionCore& session);
  /// What a session that has had its turn waits for.
  void plan(SessionCore& session);
  void watch(SessionCore& session);
  void drop_over();
  [[nodiscard]] Kept kept() const;

  GroupParts& parts_;
  int epoll_ = -1;
  int event_ = -1;
  int timer_ = -1;
  LinkWatch link_;
  WaitSet set_;

  mutable std::mutex mutex_;  ///< of what follows
  Kept sessions_;
  std::set<std::uint64_t> woken_;
  bool over_ = false;
  bool wake_failed_ = false;  ///< some number is missing in woken_

  // Of the thread that runs turns.
  std::map<CVexaCommon*, std::uint64_t> watched_;  ///< drivers in the set, and whose they are
  std::map<std::uint64_t, Watched> drivers_;       ///< the same by session
  std::vector<std::uint64_t> gone_;                ///< sessions that are over
  std::map<std::uint64_t, std::shared_ptr<Session>> handles_;
  Moment next_ = kNever;   ///< no session has an earlier deadline
  Moment armed_ = kNever;  ///< what the timer is set to
  bool all_due_ = false;   ///< memory was short, so that any session may have been passed over
  std::vector<ReadyDriver> ready_;
};

}  // namespace vexa
