// SPDX-License-Identifier: Apache-2.0
// What a session does next, from what it has seen.
#pragma once

#include <cstdint>
#include <string>

#include "session/core/back_off.h"
#include "session/core/event_slot.h"
#include "session/core/moment.h"
#include "vexa/session_status.h"

namespace vexa {

/// When something came from the camera for the last time; far in the past where nothing has.
struct MediaEvidence {
  Moment video{Moment::min()};   ///< bytes of video
  Moment other{Moment::min()};   ///< of the camera's other streams
  Moment answer{Moment::min()};  ///< to a request, such as a keep-alive
};

/// How long a session waits for pictures.
struct Patience {
  Moment stall{4000};           ///< without a whole picture: stalled
  Moment first_picture{20000};  ///< from the opening to the first whole picture: given up
  Moment give_up{12000};        ///< without a whole picture, after the first: given up
};

/// The states of one session and what leads from one to the other. Holds no socket, thread or clock: whoever has them
/// reports what happens, does what is due and asks again at deadline(). Not thread-safe.
class SessionMachine {
 public:
  SessionMachine(bool wants_video, Patience patience) : wants_video_(wants_video), patience_(patience) {}

  // What the host wants.
  void start(Moment now);
  void stop(Moment now);
  /// One attempt now, whatever the plan was.
  void retry(Moment now);

  // What happens.
  void connecting(Moment now);
  /// Not yet, for this reason; the next look at `until`, kNever when only the host changes that.
  void hold(SessionCause cause, Moment until, Moment now);
  void opened(Moment now);
  /// The attempt, or what runs, has failed. `chance` from 0 up to 1 draws the wait. What runs is to be closed first:
  /// closed() follows.
  void failed(ELibDReturnCode code, const std::string& text, double chance, Moment now);
  /// The camera refuses the credentials; its breaker knows when to try again.
  void refused_credentials(ELibDReturnCode code, const std::string& text, Moment until, Moment now);
  /// The same for a reason that is not the driver's.
  void refused(SessionCause cause, ELibDReturnCode code, const std::string& text, double chance, Moment now);
  /// Something has become of the credentials: what waits for them looks again.
  void credentials_changed(Moment now);
  void picture(Moment now);
  /// The stream of a live session has another codec, size or clock than before.
  void stream_changed(Moment now);
  void evidence(const MediaEvidence& latest) { seen_ = latest; }
  /// Link or route is back: what waits for an answer of the camera tries at once, yet once a second at most; an attempt
  /// that is under way is followed by the next at once. True when what is open has stalled and is to be closed: then
  /// closed() follows.
  [[nodiscard]] bool link_back(Moment now);
  /// Whatever was open is closed.
  void closed(Moment now);
  /// Time has passed. True when what is open is to be closed, since its pictures do not come: then closed() follows.
  bool is_hopeless(double chance, Moment now);

  // What is to be done.
  [[nodiscard]] bool is_due(Moment now) const;
  [[nodiscard]] bool is_stopping() const { return stopping_; }
  [[nodiscard]] bool is_over() const { return status().state == SessionState::kStopped; }
  /// When the passing of time alone changes something; kNever when it does not.
  [[nodiscard]] Moment deadline() const;

  [[nodiscard]] const SessionStatus& status() const { return events_.latest(); }
  [[nodiscard]] EventSlot& events() { return events_; }

 private:
  enum class Line { kClosed, kOpening, kOpen, kClosing };  // to the camera

  /// After a failure. True when the session stops instead of going on.
  [[nodiscard]] bool leave_line(Moment now);
  void enter(SessionState state, SessionCause cause, Moment now);
  void enter_failed(SessionState state, SessionCause cause, ELibDReturnCode code, const std::string& text, Moment now);
  [[nodiscard]] SessionCause cause_of_silence(Moment now) const;
  /// What has failed is to be tried again: after a wait, or at once when a link was back meanwhile.
  void plan(double chance, Moment now);
  [[nodiscard]] Moment last_sign() const { return has_picture_ ? last_picture_ : opened_; }

  const bool wants_video_;
  const Patience patience_;
  EventSlot events_;
  BackOff back_off_;
  Line line_ = Line::kClosed;
  bool started_ = false;
  bool stopping_ = false;
  std::uint32_t attempt_ = 0;
  Moment due_ = kNever;      ///< the next attempt
  Moment link_back_{-1000};  ///< when the latest attempt for a link was due
  bool link_news_ = false;   ///< a link was back during the attempt that is under way
  Moment opened_{0};
  bool has_picture_ = false;  ///< since it was opened
  Moment last_picture_{0};
  Moment live_since_{0};                        ///< whole pictures without a stall
  SessionCause reason_ = SessionCause::kAsked;  ///< of the latest attempt, or of the next
  MediaEvidence seen_;
};

}  // namespace vexa
