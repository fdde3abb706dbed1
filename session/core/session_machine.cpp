// SPDX-License-Identifier: Apache-2.0
#include "session/core/session_machine.h"

#include <algorithm>
#include <exception>
#include <utility>

#include "session/core/failure_cause.h"
#include "session/core/why_not_live.h"

namespace vexa {
namespace {

// Routes may come and go in a flood.
constexpr Moment kBetweenLinks{1000};

}  // namespace

void SessionMachine::start(Moment now) {
  if (started_) return;
  started_ = true;
  due_ = now;
}

void SessionMachine::stop(Moment now) {
  stopping_ = true;
  due_ = kNever;
  if (line_ == Line::kClosed) closed(now);
}

void SessionMachine::retry(Moment now) {
  if (!started_ || stopping_ || line_ == Line::kOpening || line_ == Line::kOpen) return;
  back_off_.reset();
  due_ = now;
}

void SessionMachine::connecting(Moment now) {
  line_ = Line::kOpening;
  link_news_ = false;
  due_ = kNever;
  ++attempt_;
  enter(SessionState::kConnecting, reason_, now);
}

void SessionMachine::hold(SessionCause cause, Moment until, Moment now) {
  due_ = until;
  const SessionState state = is_refusal(cause) ? SessionState::kRefused : SessionState::kWaiting;
  const std::int64_t next = until == kNever ? 0 : until.count();
  const SessionStatus& latest = status();
  if (latest.state == state && latest.cause == cause && latest.nextAttempt == next) return;
  enter(state, cause, now);
}

void SessionMachine::opened(Moment now) {
  line_ = Line::kOpen;
  opened_ = now;
  has_picture_ = false;
  seen_ = {};
  if (wants_video_) return;
  attempt_ = 0;
  live_since_ = now;
  enter(SessionState::kLive, reason_, now);
}

bool SessionMachine::leave_line(Moment now) {
  if (line_ == Line::kOpen && !wants_video_) back_off_.prove(live_since_, now);
  line_ = line_ == Line::kOpen ? Line::kClosing : Line::kClosed;
  if (stopping_ && line_ == Line::kClosed) closed(now);
  return stopping_;
}

void SessionMachine::failed(ELibDReturnCode code, const std::string& text, double chance, Moment now) {
  refused(cause_of(code, text), code, text, chance, now);
}

void SessionMachine::refused(SessionCause cause, ELibDReturnCode code, const std::string& text, double chance,
                             Moment now) {
  if (leave_line(now)) return;
  reason_ = cause;
  plan(chance, now);
  enter_failed(is_refusal(reason_) ? SessionState::kRefused : SessionState::kWaiting, reason_, code, text, now);
}

void SessionMachine::plan(double chance, Moment now) {
  due_ = now + back_off_.next(chance);
  if (std::exchange(link_news_, false) && !is_refusal(reason_)) due_ = now + BackOff::kLeast;
}

void SessionMachine::refused_credentials(ELibDReturnCode code, const std::string& text, Moment until, Moment now) {
  if (leave_line(now)) return;
  due_ = until;
  reason_ = SessionCause::kCredentials;
  enter_failed(SessionState::kRefused, reason_, code, text, now);
}

void SessionMachine::picture(Moment now) {
  if (line_ != Line::kOpen) return;
  has_picture_ = true;
  link_news_ = false;
  last_picture_ = now;
  if (status().state != SessionState::kLive) {
    attempt_ = 0;
    live_since_ = now;
    enter(SessionState::kLive, reason_, now);
  }
  back_off_.prove(live_since_, now);
}

void SessionMachine::stream_changed(Moment now) {
  if (status().state == SessionState::kLive) enter(SessionState::kLive, SessionCause::kStreamChanged, now);
}

bool SessionMachine::link_back(Moment now) {
  const SessionState state = status().state;
  const SessionCause cause = status().cause;
  if (stopping_) return false;
  if (state == SessionState::kConnecting) link_news_ = true;
  const bool stalled = state == SessionState::kStalled && line_ == Line::kOpen;
  const bool waits =
      state == SessionState::kWaiting && cause != SessionCause::kTurn && cause != SessionCause::kOtherTrial;
  if (!stalled && !waits) return false;
  const Moment at = std::max(now, link_back_ + kBetweenLinks);
  if (waits && at >= due_) return false;
  due_ = link_back_ = at;
  if (!stalled) return false;
  reason_ = cause;
  line_ = Line::kClosing;
  enter_failed(SessionState::kWaiting, reason_, LIBD_TIMEOUT, "", now);
  return true;
}

void SessionMachine::credentials_changed(Moment now) {
  const SessionCause cause = status().cause;
  const bool waits = cause == SessionCause::kCredentials || cause == SessionCause::kOtherTrial;
  if (waits && started_ && !stopping_ && line_ == Line::kClosed) due_ = now;
}

void SessionMachine::closed(Moment now) {
  line_ = Line::kClosed;
  if (stopping_ && !is_over()) enter(SessionState::kStopped, SessionCause::kAsked, now);
}

bool SessionMachine::is_hopeless(double chance, Moment now) {
  if (line_ != Line::kOpen || !wants_video_ || stopping_) return false;
  const Moment silence = now - last_sign();
  if (silence >= (has_picture_ ? patience_.give_up : patience_.first_picture)) {
    reason_ = cause_of_silence(now);
    line_ = Line::kClosing;
    plan(chance, now);
    enter_failed(SessionState::kWaiting, reason_, LIBD_TIMEOUT, "", now);
    return true;
  }
  if (silence < patience_.stall) {
    if (has_picture_ && status().state == SessionState::kLive) back_off_.prove(live_since_, last_picture_);
    return false;
  }
  const SessionCause cause = cause_of_silence(now);
  if (status().state != SessionState::kStalled || status().cause != cause) enter(SessionState::kStalled, cause, now);
  return false;
}

bool SessionMachine::is_due(Moment now) const {
  return started_ && !stopping_ && line_ == Line::kClosed && due_ != kNever && now >= due_;
}

Moment SessionMachine::deadline() const {
  if (line_ == Line::kClosed) return stopping_ ? kNever : due_;
  if (line_ != Line::kOpen || !wants_video_ || stopping_) return kNever;
  const Moment end = last_sign() + (has_picture_ ? patience_.give_up : patience_.first_picture);
  return status().state == SessionState::kStalled ? end : std::min(end, last_sign() + patience_.stall);
}

void SessionMachine::enter(SessionState state, SessionCause cause, Moment now) {
  enter_failed(state, cause, LIBD_OK, "", now);
}

void SessionMachine::enter_failed(SessionState state, SessionCause cause, ELibDReturnCode code, const std::string& text,
                                  Moment now) {
  SessionStatus status;
  status.state = state;
  status.cause = cause;
  status.code = code;
  status.attempt = attempt_;
  status.nextAttempt = due_ == kNever ? 0 : due_.count();
  // A stall is reported as long as the silence is.
  status.since = (state == SessionState::kStalled ? last_sign() : now).count();
  try {
    status.text = text;
    status.why = why_not_live(status, now);
  } catch (const std::exception&) {
    // Memory is short: the state counts, not its words.
  }
  status.since = now.count();
  events_.put(std::move(status));
}

// What still comes: the beginning of a picture that was cut off is no sign, so that only the latter half of the silence
// counts.
SessionCause SessionMachine::cause_of_silence(Moment now) const {
  const Moment recent = now - (now - last_sign()) / 2;
  if (seen_.video >= recent) return SessionCause::kNoWholePicture;
  if (seen_.other >= recent) return SessionCause::kOneTrack;
  if (seen_.answer >= recent) return SessionCause::kControlOnly;
  return SessionCause::kNoBytes;
}

}  // namespace vexa
