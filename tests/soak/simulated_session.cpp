// SPDX-License-Identifier: Apache-2.0
#include "tests/soak/simulated_session.h"

#include <algorithm>
#include <chrono>

#include "transport/wire/rtsp_request.h"

namespace vexa_test {
namespace {

using std::chrono::hours;
using std::chrono::minutes;
using std::chrono::seconds;
using vexa::Moment;
using State = vexa::SessionState;

constexpr int kSessionTimeout = 60;  // seconds, as the camera names it
// The longest wait, an attempt, the turns of others, and a stall that the outage's end came into.
constexpr Moment kLongestReturn = minutes(5);
// Refused credentials that worked before are tried again after an hour at the latest.
constexpr Moment kLongestReturnOfPassword = minutes(66);
constexpr std::uint64_t kMostRefusals =
    4;  // an outage is not longer than half an hour: at once, after 1, 5 and 15 minutes

}  // namespace

SimulatedSession::SimulatedSession(std::uint64_t number, std::uint32_t seed, vexa::Admission& turns)
    : number_(number), random_(seed), turns_(turns), stream_(seed + 1) {
  breaker_.set_password("secret");
  machine_.start(Moment(0));
  outage_ends_ = seconds(60 + random_() % 7200);
}

const char* SimulatedSession::second(Moment now, std::time_t wall) {
  change_camera(now);
  if (attempting_ && now >= attempt_ends_) end_attempt(now);
  if (!attempting_ && !open_ && (machine_.is_due(now) || machine_.status().cause == vexa::SessionCause::kTurn)) {
    begin_attempt(now);
  }
  if (open_) {
    if (const char* wrong = run_stream(now, wall)) return wrong;
  }
  if (machine_.is_hopeless(chance(), now)) close(now);
  return judge(now);
}

const char* SimulatedSession::stop(Moment now) {
  machine_.stop(now);
  turns_.leave(number_);
  if (open_ || attempting_) close(now);
  return machine_.is_over() ? nullptr : "a stopped session is not over";
}

void SimulatedSession::change_camera(Moment now) {
  if (now < outage_ends_) return;
  if (outage_ == Outage::kNone) {
    constexpr Outage kOutages[] = {Outage::kUnreachable, Outage::kUnreachable, Outage::kSilent,
                                   Outage::kSilent,      Outage::kBusy,        Outage::kWrongPassword};
    outage_ = kOutages[random_() % std::size(kOutages)];
    outage_ends_ = now + seconds(1 + random_() % (random_() % 4 == 0 ? 1800 : 30));
    has_returned_ = false;
    refusals_ = 0;
    ++outages_;
    // All but a camera that falls silent reset what is open.
    if (open_ && outage_ != Outage::kSilent) {
      machine_.failed(LIBD_FAILED, "Connection reset by peer", chance(), now);
      close(now);
      breaker_.doubt();
    }
    return;
  }
  outage_ = Outage::kNone;
  well_since_ = now;
  outage_ends_ = now + seconds(600 + random_() % 14400);
}

void SimulatedSession::begin_attempt(Moment now) {
  if (!turns_.enter(number_)) return machine_.hold(vexa::SessionCause::kTurn, vexa::kNever, now);
  const auto answer = breaker_.ask(now);
  if (answer != vexa::CredentialBreaker::Answer::kGo && answer != vexa::CredentialBreaker::Answer::kTry) {
    turns_.leave(number_);
    return machine_.hold(vexa::SessionCause::kCredentials, std::max(breaker_.retry_at(), now + seconds(1)), now);
  }
  ++attempts_;
  machine_.connecting(now);
  attempting_ = true;
  attempt_ends_ = now + (outage_ == Outage::kUnreachable ? seconds(5) : seconds(1));
}

void SimulatedSession::end_attempt(Moment now) {
  attempting_ = false;
  turns_.leave(number_);
  switch (outage_) {
    case Outage::kNone:
    case Outage::kSilent:
      breaker_.accepted();
      machine_.opened(now);
      stream_.begin();
      open_ = true;
      last_keep_alive_ = 0;
      kept_alive_ = now;
      return;
    case Outage::kUnreachable:
      breaker_.abandoned();
      return machine_.failed(LIBD_TIMEOUT, "Connection timed out", chance(), now);
    case Outage::kBusy:
      breaker_.accepted();
      return machine_.failed(LIBD_STREAM_OPEN_FAILED, "Not Enough Bandwidth", chance(), now);
    case Outage::kWrongPassword:
      ++refusals_;
      breaker_.refused(now);
      return machine_.refused_credentials(LIBD_UNAUTHORIZED, "Unauthorized", breaker_.retry_at(), now);
  }
}

void SimulatedSession::close(Moment now) {
  if (attempting_) turns_.leave(number_);
  if (open_) stream_.end();
  attempting_ = open_ = false;
  machine_.closed(now);
}

const char* SimulatedSession::run_stream(Moment now, std::time_t wall) {
  if (outage_ == Outage::kSilent) return nullptr;
  machine_.picture(now);
  if (!has_returned_ && outage_ == Outage::kNone) {
    has_returned_ = true;
    longest_return_ = std::max(longest_return_, now - well_since_);
  }
  if (const char* wrong = stream_.second(now.count(), std::int64_t{wall} * 1000000000)) return wrong;
  return keep_alive(now, wall);
}

const char* SimulatedSession::keep_alive(Moment now, std::time_t wall) {
  const int interval = vexa::keep_alive_interval(kSessionTimeout);
  if (!vexa::keep_alive_due(wall, last_keep_alive_, interval)) {
    return now - kept_alive_ > seconds(interval + 1) ? "a keep-alive is overdue" : nullptr;
  }
  last_keep_alive_ = wall;
  kept_alive_ = now;
  ++keep_alives_;
  return nullptr;
}

const char* SimulatedSession::judge(Moment now) {
  const vexa::SessionStatus& status = machine_.status();
  if (status.event != latest_event_) {
    trace_ =
        (trace_ ^ static_cast<std::uint64_t>(status.state) ^ status.event ^ static_cast<std::uint64_t>(now.count())) *
        1099511628211U;
  }
  if (status.event < latest_event_) return "events go back";
  latest_event_ = status.event;
  if ((status.state == State::kLive || status.state == State::kStalled) != open_ &&
      status.state != State::kConnecting) {
    return "the state does not agree with the connection";
  }
  if (status.since > now.count()) return "a state began in the future";
  if (refusals_ > kMostRefusals) return "refused credentials were sent too often";
  const bool by_password = outage_ == Outage::kNone && breaker_.is_refused();
  const Moment most = by_password || refusals_ > 0 ? kLongestReturnOfPassword : kLongestReturn;
  if (outage_ == Outage::kNone && !has_returned_ && now - well_since_ > most) {
    return "the camera is well, and the session does not return";
  }
  return nullptr;
}

}  // namespace vexa_test
