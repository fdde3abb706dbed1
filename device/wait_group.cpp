#include "device/wait_group.h"

#include <sys/epoll.h>
#include <sys/timerfd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>

#include "runtime/base/deadline.h"
#include "runtime/base/result.h"

namespace vexa {
namespace {

// What epoll returns with an event: one of these, or a membership and a polled stream of it.
constexpr std::uint64_t kVideoEvent = 0;
constexpr std::uint64_t kTimerEvent = 1;
constexpr unsigned kStreamBits = 2;
constexpr std::uint64_t kStreamMask = 3;
static_assert(kPolledCount <= kStreamMask + 1);

constexpr int kEventsAtOnce = 64;  // the others follow with the next wait

/// The clock that polls read is behind the timer's by up to a tick.
constexpr long kClockLag = 10'000'000;  // nanoseconds

std::uint64_t event_of(WaitGroup::Key key, std::size_t stream) { return key << kStreamBits | stream; }

bool watch_readable(int epoll, int descriptor, std::uint64_t event) {
  epoll_event entry{};
  entry.events = EPOLLIN;
  entry.data.u64 = event;
  return epoll_ctl(epoll, EPOLL_CTL_ADD, descriptor, &entry) == 0;
}

void add_to(std::vector<ReadyDriver>& ready, CVexaCommon* driver, std::size_t& place, std::uint32_t stream) {
  if (place >= ready.size() || ready[place].driver != driver) {
    place = ready.size();
    ready.push_back({driver, 0});
  }
  ready[place].streams |= stream;
}

}  // namespace

WaitingFailure waiting_failure(int error) { return error == ENOMEM ? kNoMemoryLeft : kNoDescriptorLeft; }

bool WaitGroup::open() {
  if (epoll_.valid()) return true;
  Socket epoll(epoll_create1(EPOLL_CLOEXEC));
  Socket timer(timerfd_create(CLOCK_REALTIME, TFD_CLOEXEC | TFD_NONBLOCK));
  if (!epoll.valid() || !timer.valid() || video_.open(false) == -1) return false;
  if (!watch_readable(epoll.get(), timer.get(), kTimerEvent)) return false;
  if (!watch_readable(epoll.get(), video_.descriptor(), kVideoEvent)) return false;
  epoll_ = std::move(epoll);
  timer_ = std::move(timer);
  return true;
}

int WaitGroup::descriptor() {
  const Guard guard(lock_);
  return open() ? epoll_.get() : waiting_failure(errno);
}

int WaitGroup::wait(std::vector<ReadyDriver>& ready, int milliseconds) {
  ready.clear();
  const int epoll = descriptor();
  if (epoll < 0) return epoll;
  const auto end = std::chrono::steady_clock::now() + std::chrono::milliseconds(milliseconds);
  for (;;) {
    epoll_event events[kEventsAtOnce];
    const int left = milliseconds < 0 ? -1 : std::max(milliseconds_until(end), 0);
    const int count = epoll_wait(epoll, events, kEventsAtOnce, left);
    const bool fitted = within_memory([&] {
      const Guard guard(lock_);
      ready.reserve(members_.size());
      for (int i = 0; i < count; ++i) collect(events[i].data.u64, ready);
    });
    if (!fitted) return kNoMemoryLeft;
    // What woke it may be over by now.
    if (!ready.empty() || left == 0) return static_cast<int>(ready.size());
  }
}

void WaitGroup::collect(std::uint64_t event, std::vector<ReadyDriver>& ready) {
  if (event == kTimerEvent) {
    collect_due(ready);
  } else if (event == kVideoEvent) {
    for (const Key key : video_ready_) {
      Member& member = members_.at(key);
      add_to(ready, member.driver, member.place, kVideoStream);
    }
  } else {
    const auto found = members_.find(event >> kStreamBits);
    const auto stream = static_cast<std::size_t>(event & kStreamMask);
    if (found == members_.end() || found->second.watched[stream] == -1) return;
    add_to(ready, found->second.driver, found->second.place, kPolledStreams[stream]);
  }
}

// The timer stays readable as long as it stands at a second that has passed: until what was due has been polled.
void WaitGroup::collect_due(std::vector<ReadyDriver>& ready) {
  std::int64_t next = kNever;
  for (auto& [key, member] : members_) {
    for (std::size_t i = 0; i < kPolledCount; ++i) {
      const PolledState& state = member.polled[i];
      if (state.socket == -1 || (member.wanted & kPolledStreams[i]) == 0) continue;
      if (state.due <= (*member.now)()) add_to(ready, member.driver, member.place, kPolledStreams[i]);
      next = std::min(next, state.due);
    }
  }
  if (next != timer_at_) set_timer(next);
}

WaitGroup::Key WaitGroup::join(CVexaCommon* driver, const SecondsClock& now, std::uint32_t wanted) {
  Key key = 0;
  const bool fitted = within_memory([&] {
    const Guard guard(lock_);
    if (!open()) return;
    video_ready_.reserve(members_.size() + 1);
    members_.emplace(last_key_ + 1, Member{driver, &now, wanted});
    key = ++last_key_;
  });
  return fitted ? key : 0;
}

void WaitGroup::leave(Key key) {
  want(key, 0);
  const Guard guard(lock_);
  members_.erase(key);
}

void WaitGroup::want(Key key, std::uint32_t wanted) {
  const Guard guard(lock_);
  const auto found = members_.find(key);
  if (found == members_.end()) return;
  found->second.wanted = wanted;
  list_video(key, found->second);
  for (std::size_t i = 0; i < kPolledCount; ++i) watch(key, found->second, i);
  bring_timer_forward(found->second);
}

void WaitGroup::set_video(Key key, bool ready) {
  const Guard guard(lock_);
  const auto found = members_.find(key);
  if (found == members_.end()) return;
  found->second.video = ready;
  list_video(key, found->second);
}

void WaitGroup::list_video(Key key, const Member& member) {
  const auto place = std::find(video_ready_.begin(), video_ready_.end(), key);
  const bool listed = place != video_ready_.end();
  const bool ready = member.video && (member.wanted & kVideoStream) != 0;
  if (ready == listed) return;
  if (ready) {
    video_ready_.push_back(key);
    if (video_ready_.size() == 1) video_.raise();
  } else {
    video_ready_.erase(place);
    if (video_ready_.empty()) video_.lower();
  }
}

void WaitGroup::set_polled(Key key, std::size_t stream, const PolledState& state) {
  const Guard guard(lock_);
  const auto found = members_.find(key);
  if (found == members_.end()) return;
  found->second.polled[stream] = state;
  watch(key, found->second, stream);
  bring_timer_forward(found->second);
}

// A connection that the system refuses to watch wakes nobody but by what falls due.
void WaitGroup::watch(Key key, Member& member, std::size_t stream) {
  const PolledState& state = member.polled[stream];
  const bool wanted = (member.wanted & kPolledStreams[stream]) != 0 && !state.resting;
  const int socket = wanted ? state.socket : -1;
  int& watched = member.watched[stream];
  if (watched == socket) return;
  if (watched != -1) epoll_ctl(epoll_.get(), EPOLL_CTL_DEL, watched, nullptr);
  watched = socket != -1 && watch_readable(epoll_.get(), socket, event_of(key, stream)) ? socket : -1;
}

// One that stands too early is put right when it has fired.
void WaitGroup::bring_timer_forward(const Member& member) {
  for (std::size_t i = 0; i < kPolledCount; ++i) {
    const PolledState& state = member.polled[i];
    if (state.socket == -1 || (member.wanted & kPolledStreams[i]) == 0) continue;
    if (state.due < timer_at_) set_timer(state.due);
  }
}

void WaitGroup::set_timer(std::int64_t due) {
  timer_at_ = due;
  itimerspec at{};  // zero: never
  if (due <= std::numeric_limits<std::time_t>::max()) {
    at.it_value = {static_cast<std::time_t>(std::max<std::int64_t>(due, 0)), kClockLag};
  }
  timerfd_settime(timer_.get(), TFD_TIMER_ABSTIME, &at, nullptr);
}

void WaitGroup::close() {
  const Guard guard(lock_);
  closed_ = true;
  members_.clear();
  video_ready_.clear();
  video_.close();
  epoll_ = Socket();
  timer_ = Socket();
}

bool WaitGroup::is_closed() {
  const Guard guard(lock_);
  return closed_;
}

}  // namespace vexa
