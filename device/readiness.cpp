#include "device/readiness.h"

#include <algorithm>
#include <cerrno>
#include <chrono>

#include "runtime/base/result.h"
#include "transport/wait_budget.h"

namespace vexa {
namespace {

std::size_t place_of(StreamBits stream) {
  const auto* found = std::find(std::begin(kPolledStreams), std::end(kPolledStreams), stream);
  return static_cast<std::size_t>(found - std::begin(kPolledStreams));
}

// Data, or the end of the connection.
bool is_readable(int socket) { return WaitBudget(0).wait_readable(socket) == 1; }

}  // namespace

Readiness::~Readiness() {
  for (const Membership& membership : memberships_) membership.group->leave(membership.key);
}

void Readiness::set_video(bool ready) {
  const Guard guard(lock_);
  if (video_ == ready) return;
  video_ = ready;
  if (ready) {
    video_event_.raise();
    if (waiters_ > 0) video_changed_.notify_all();
  } else {
    video_event_.lower();
  }
  for (const Membership& membership : memberships_) membership.group->set_video(membership.key, ready);
}

void Readiness::opened(StreamBits stream, int socket, std::int64_t due) {
  const Guard guard(lock_);
  set_polled(place_of(stream), {socket, due, false});
}

void Readiness::closed(StreamBits stream) {
  const Guard guard(lock_);
  set_polled(place_of(stream), {});
}

// Bytes that give no data, and the end of a connection, would keep a host that waits busy: they rest for a second.
void Readiness::polled(StreamBits stream, int socket, std::int64_t due, bool data) {
  const Guard guard(lock_);
  const bool resting = !data && socket != -1 && is_readable(socket);
  if (resting) due = std::min<std::int64_t>(due, std::int64_t{now_()} + 1);
  set_polled(place_of(stream), {socket, due, resting});
}

void Readiness::set_polled(std::size_t stream, const PolledState& state) {
  polled_[stream] = state;
  for (const Membership& membership : memberships_) membership.group->set_polled(membership.key, stream, state);
}

bool Readiness::is_ready(const PolledState& state) const {
  if (state.socket == -1) return false;
  return state.due <= now_() || (!state.resting && is_readable(state.socket));
}

std::uint32_t Readiness::ready(std::uint32_t wanted) {
  const Guard guard(lock_);
  std::uint32_t found = video_ ? wanted & kVideoStream : 0;
  for (std::size_t i = 0; i < kPolledCount; ++i) {
    if ((wanted & kPolledStreams[i]) != 0 && is_ready(polled_[i])) found |= kPolledStreams[i];
  }
  return found;
}

bool Readiness::wait_for_video(int milliseconds) {
  const auto end = std::chrono::steady_clock::now() + std::chrono::milliseconds(milliseconds);
  const Guard guard(lock_);
  ++waiters_;
  bool in_time = true;
  while (!video_ && in_time) {
    if (milliseconds < 0) {
      video_changed_.wait(lock_);
    } else {
      in_time = video_changed_.wait_until(lock_, end) == std::cv_status::no_timeout;
    }
  }
  --waiters_;
  return video_;
}

int Readiness::video_descriptor() {
  const Guard guard(lock_);
  return video_event_.open(video_) == -1 ? waiting_failure(errno) : video_event_.descriptor();
}

bool Readiness::join(const std::shared_ptr<WaitGroup>& group, std::uint32_t wanted) {
  const Guard guard(lock_);
  const auto same = [&](const Membership& membership) { return membership.group == group; };
  const auto found = std::find_if(memberships_.begin(), memberships_.end(), same);
  if (found != memberships_.end()) {
    group->want(found->key, wanted);
    return true;
  }
  const auto is_over = [](const Membership& membership) { return membership.group->is_closed(); };
  memberships_.erase(std::remove_if(memberships_.begin(), memberships_.end(), is_over), memberships_.end());
  const bool fitted = within_memory([&] {
    const Guard same_guard(lock_);
    memberships_.reserve(memberships_.size() + 1);
  });
  if (!fitted) return false;
  const WaitGroup::Key key = group->join(driver_, now_, wanted);
  if (key == 0) return false;
  memberships_.push_back({group, key});
  group->set_video(key, video_);
  for (std::size_t i = 0; i < kPolledCount; ++i) group->set_polled(key, i, polled_[i]);
  return true;
}

void Readiness::leave(const WaitGroup& group) {
  const Guard guard(lock_);
  const auto same = [&](const Membership& membership) { return membership.group.get() == &group; };
  const auto found = std::find_if(memberships_.begin(), memberships_.end(), same);
  if (found == memberships_.end()) return;
  found->group->leave(found->key);
  memberships_.erase(found);
}

}  // namespace vexa
