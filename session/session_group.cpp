// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <atomic>
#include <exception>
#include <memory>
#include <new>
#include <thread>
#include <vector>

#include "session/blocked_signals.h"
#include "session/keeper.h"
#include "vexa/session.h"

namespace vexa {

// Session N is kept by keeper N modulo their number, always the same, so that no camera has two threads at once.
class SessionGroup::Impl {
 public:
  explicit Impl(const SessionGroupOptions& options)
      : parts_(static_cast<std::size_t>(std::max(options.attempts, 1)), options.threads > 0,
               [this](std::uint64_t session) { keeper_of(session).wake(session); }) {
    const int keepers = std::max(options.threads, 1);
    for (int i = 0; i < keepers; ++i) keepers_.push_back(std::make_unique<Keeper>(parts_));
    usable_ = std::all_of(keepers_.begin(), keepers_.end(), [](const auto& keeper) { return keeper->is_usable(); });
    if (!usable_ || !parts_.has_threads) return;
    const BlockedSignals none;
    try {
      threads_.reserve(keepers_.size());  // a thread that is made has its place
      for (const auto& keeper : keepers_) {
        threads_.emplace_back([this, &keeper] { keeper->run([this] { note_link(); }); });
      }
    } catch (const std::exception&) {
      usable_ = false;
    }
  }
  Impl(const Impl&) = delete;
  Impl& operator=(const Impl&) = delete;
  ~Impl() = default;

  /// Null when memory is short.
  static std::unique_ptr<Impl> make(const SessionGroupOptions& options) {
    try {
      return std::make_unique<Impl>(options);
    } catch (const std::exception&) {
      return nullptr;
    }
  }

  /// Stops all sessions and waits for them. Their last callbacks may still call this group.
  void finish() {
    // Nothing more is opened once the end has begun, so that it comes.
    for (const auto& keeper : keepers_) keeper->end();
    for (const auto& keeper : keepers_) keeper->stop_all();
    for (std::thread& thread : threads_) thread.join();
    // Without threads this one finishes what there is.
    while (usable_ && !parts_.has_threads && keepers_.front()->size() > 0) process(-1);
  }

  std::shared_ptr<Session> open(const SessionOptions& options, const SessionCallbacks& callbacks) {
    if (!usable_) return nullptr;
    const std::uint64_t number = ++latest_;
    Keeper& keeper = keeper_of(number);
    const auto core = SessionCore::make(number, options, callbacks, parts_,
                                        [&keeper](std::uint64_t session) { keeper.wake(session); });
    std::shared_ptr<Session> session = core->handle();
    return keeper.add(core) ? session : nullptr;
  }

  [[nodiscard]] int descriptor() const { return usable_ && !parts_.has_threads ? keepers_.front()->descriptor() : -1; }

  int process(std::int32_t milliseconds) {
    if (!usable_ || parts_.has_threads) return 0;
    return keepers_.front()->turn(milliseconds, [this] { note_link(); });
  }

  [[nodiscard]] SessionMetrics metrics() const {
    const GroupCounts& counts = parts_.counts;
    SessionMetrics metrics;
    for (const auto& keeper : keepers_) metrics.sessions += static_cast<std::uint32_t>(keeper->size());
    metrics.threads = static_cast<std::uint32_t>(threads_.size() + parts_.connectors.threads() +
                                                 parts_.sides.threads() + parts_.closers.threads());
    metrics.descriptors = static_cast<std::uint32_t>(keepers_.size()) * Keeper::descriptors();
    metrics.wakeUps = counts.wake_ups;
    metrics.longestCallback = counts.longest_callback;
    metrics.attempts = counts.attempts;
    metrics.mostAttemptsAtOnce = counts.most_at_once;
    metrics.eventsMissed = counts.events_missed;
    metrics.exceptions = counts.exceptions;
    metrics.mostTurnsWaited = counts.most_turns_waited;
    metrics.mostJobsQueued =
        std::max({parts_.connectors.most_queued(), parts_.sides.most_queued(), parts_.closers.most_queued()});
    return metrics;
  }

 private:
  Keeper& keeper_of(std::uint64_t session) { return *keepers_[static_cast<std::size_t>(session % keepers_.size())]; }

  void note_link() {
    for (const auto& keeper : keepers_) keeper->note_link();
  }

  // In this order: jobs are over before the keepers go that they wake.
  std::vector<std::unique_ptr<Keeper>> keepers_;
  GroupParts parts_;
  bool usable_ = false;
  std::vector<std::thread> threads_;
  std::atomic<std::uint64_t> latest_{0};
};

SessionGroup::SessionGroup(const SessionGroupOptions& options) : impl_(Impl::make(options)) {}

SessionGroup::~SessionGroup() {
  if (impl_) impl_->finish();
}

std::shared_ptr<Session> SessionGroup::Open(const SessionOptions& options, const SessionCallbacks& callbacks) {
  if (!impl_) return nullptr;
  try {
    return impl_->open(options, callbacks);
  } catch (const std::exception&) {
    return nullptr;
  }
}

int SessionGroup::Descriptor() const { return impl_ ? impl_->descriptor() : -1; }

int SessionGroup::Process(std::int32_t milliseconds) { return impl_ ? impl_->process(milliseconds) : 0; }

SessionMetrics SessionGroup::Metrics() const { return impl_ ? impl_->metrics() : SessionMetrics(); }

}  // namespace vexa
