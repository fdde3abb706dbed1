// SPDX-License-Identifier: Apache-2.0
#include "session/keeper.h"

#include <sys/epoll.h>
#include <sys/eventfd.h>
#include <sys/timerfd.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <exception>
#include <utility>

#include "session/clock.h"

namespace vexa {
namespace {

thread_local int turns_of_this_thread = 0;

class TurnMark {
 public:
  TurnMark() { ++turns_of_this_thread; }
  ~TurnMark() { --turns_of_this_thread; }
  TurnMark(const TurnMark&) = delete;
  TurnMark& operator=(const TurnMark&) = delete;
};

bool watch_descriptor(int epoll, int descriptor) {
  epoll_event event{};
  event.events = EPOLLIN;
  event.data.fd = descriptor;
  return epoll_ctl(epoll, EPOLL_CTL_ADD, descriptor, &event) == 0;
}

void drain(int descriptor) {
  std::uint64_t count = 0;
  [[maybe_unused]] const ssize_t got = read(descriptor, &count, sizeof count);
}

}  // namespace

bool is_keeper_thread() { return turns_of_this_thread > 0; }

Keeper::Keeper(GroupParts& parts)
    : parts_(parts),
      epoll_(epoll_create1(EPOLL_CLOEXEC)),
      event_(eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)),
      timer_(timerfd_create(CLOCK_MONOTONIC, TFD_CLOEXEC | TFD_NONBLOCK)) {
  const int set = set_.Descriptor();
  const bool watched = epoll_ >= 0 && event_ >= 0 && timer_ >= 0 && set >= 0 && watch_descriptor(epoll_, event_) &&
                       watch_descriptor(epoll_, timer_) && watch_descriptor(epoll_, set);
  if (watched && link_.descriptor() >= 0) watch_descriptor(epoll_, link_.descriptor());
  if (watched) return;
  if (epoll_ >= 0) close(std::exchange(epoll_, -1));
}

Keeper::~Keeper() {
  for (const int descriptor : {epoll_, event_, timer_}) {
    if (descriptor >= 0) close(descriptor);
  }
}

bool Keeper::is_usable() const { return epoll_ >= 0; }

bool Keeper::add(const std::shared_ptr<SessionCore>& session) {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    if (over_) return false;
    sessions_[session->number()] = session;
  }
  wake(session->number());
  return true;
}

void Keeper::wake(std::uint64_t number) {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    if (sessions_.count(number) == 0) return;
    try {
      if (!woken_.insert(number).second) return;
    } catch (const std::exception&) {
      wake_failed_ = true;
    }
  }
  const std::uint64_t one = 1;
  [[maybe_unused]] const ssize_t written = write(event_, &one, sizeof one);
}

void Keeper::stop_all() {
  for (const auto& [number, session] : kept()) session->stop();
}

void Keeper::note_link() {
  for (const auto& [number, session] : kept()) session->note_link();
}

std::size_t Keeper::size() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return sessions_.size();
}

Keeper::Kept Keeper::kept() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return sessions_;
}

int Keeper::turn(std::int32_t milliseconds, const std::function<void()>& on_link) {
  if (is_keeper_thread()) return 0;
  const TurnMark mark;
  std::array<epoll_event, 4> events{};
  const int count = epoll_wait(epoll_, events.data(), static_cast<int>(events.size()), milliseconds);
  ++parts_.counts.wake_ups;
  bool ready = false;
  for (int i = 0; i < count; ++i) {
    const int descriptor = events[static_cast<std::size_t>(i)].data.fd;
    if (descriptor == event_ || descriptor == timer_) {
      drain(descriptor);
      if (descriptor == timer_) armed_ = kNever;
    } else if (descriptor == link_.descriptor()) {
      if (link_.read_news()) on_link();
    } else {
      ready = true;
    }
  }
  const int made = serve_all(ready);
  arm(next_);
  return made;
}

int Keeper::serve_all(bool ready) {
  int made = 0;
  try {
    made += serve_woken();
    if (ready) made += serve_ready();
    made += serve_due(monotonic_now());
    drop_over();
  } catch (const std::exception&) {
    rest();
  }
  return made;
}

// Memory is short: all sessions have their turn in a moment, when there may be more.
void Keeper::rest() {
  constexpr Moment kRest{100};
  all_due_ = true;
  next_ = monotonic_now() + kRest;
  listen(false);
}

void Keeper::listen(bool on) {
  epoll_event event{};
  event.events = on ? static_cast<std::uint32_t>(EPOLLIN) : 0U;
  event.data.fd = set_.Descriptor();
  epoll_ctl(epoll_, EPOLL_CTL_MOD, event.data.fd, &event);
}

void Keeper::run(const std::function<void()>& on_link) {
  for (;;) {
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      if (over_ && sessions_.empty()) return;
    }
    turn(-1, on_link);
  }
}

void Keeper::end() {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    over_ = true;
  }
  const std::uint64_t one = 1;
  [[maybe_unused]] const ssize_t written = write(event_, &one, sizeof one);
}

int Keeper::serve_woken() {
  std::vector<std::shared_ptr<SessionCore>> sessions;
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    for (const std::uint64_t number : woken_) {
      const auto found = sessions_.find(number);
      if (found != sessions_.end()) sessions.push_back(found->second);
    }
    woken_.clear();
    if (std::exchange(wake_failed_, false)) {
      all_due_ = true;
      next_ = Moment(0);
    }
  }
  int made = 0;
  for (const auto& session : sessions) made += serve(*session);
  return made;
}

int Keeper::serve_due(Moment now) {
  if (now < next_) return 0;
  const Kept sessions = kept();
  next_ = kNever;
  const bool all = std::exchange(all_due_, false);
  if (all) listen(true);
  int made = 0;
  for (const auto& [number, session] : sessions) {
    if (all || session->deadline() <= now) {
      made += serve(*session);
    } else {
      next_ = std::min(next_, session->deadline());
    }
  }
  return made;
}

int Keeper::serve(SessionCore& session) {
  handles_.try_emplace(session.number(), session.handle());
  const int made = session.turn(monotonic_now());
  plan(session);
  return made;
}

void Keeper::plan(SessionCore& session) {
  watch(session);
  if (session.is_over()) gone_.push_back(session.number());
  next_ = std::min(next_, session.deadline());
}

int Keeper::serve_ready() {
  int made = 0;
  const int count = set_.Wait(ready_, 0);
  if (count < 0) rest();
  if (count <= 0) return 0;
  for (const ReadyDriver& driver : ready_) {
    const auto whose = watched_.find(driver.driver);
    std::shared_ptr<SessionCore> session;
    if (whose != watched_.end()) {
      const std::lock_guard<std::mutex> lock(mutex_);
      const auto found = sessions_.find(whose->second);
      if (found != sessions_.end()) session = found->second;
    }
    if (!session || session->running() != driver.driver) continue;
    made += session->take(driver.streams, monotonic_now());
    plan(*session);
  }
  return made;
}

// A driver is in the set while its streams run, for those that do.
void Keeper::watch(SessionCore& session) {
  CVexaCommon* const driver = session.running();
  const std::uint32_t streams = session.streams();
  Watched& watched = drivers_[session.number()];
  if (watched.driver == driver && (driver == nullptr || watched.streams == streams)) return;
  if (watched.driver != nullptr && watched.driver != driver) {
    set_.Remove(*watched.driver);  // it is there still: a session gets another driver when it opens again
    watched_.erase(watched.driver);
    watched = {};
  }
  if (driver == nullptr || !set_.Add(*driver, streams)) return;
  watched = {driver, streams};
  watched_[driver] = session.number();
}

void Keeper::drop_over() {
  for (const std::uint64_t number : std::exchange(gone_, {})) {
    std::shared_ptr<SessionCore> session;  // destroyed without the lock
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      const auto found = sessions_.find(number);
      if (found == sessions_.end()) continue;
      session = std::move(found->second);
      sessions_.erase(found);
    }
    handles_.erase(number);
    drivers_.erase(number);
  }
}

void Keeper::arm(Moment deadline) {
  if (std::exchange(armed_, deadline) == deadline) return;
  itimerspec when{};
  if (deadline != kNever) {
    const auto seconds = std::chrono::duration_cast<std::chrono::seconds>(deadline);
    when.it_value.tv_sec = static_cast<time_t>(seconds.count());
    when.it_value.tv_nsec = static_cast<long>((deadline - seconds).count() * 1000000 + 1);
  }
  timerfd_settime(timer_, TFD_TIMER_ABSTIME, &when, nullptr);
}

}  // namespace vexa
