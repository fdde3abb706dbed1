// Ending what waits in a driver.
#pragma once

#include <memory>

#include "vexa/export.h"

class CVexaCommon;

namespace vexa {

class CancelSignal;

/// Ends what waits in `driver` at this moment, within 100 ms: starts, stops, requests, inquiries and polls, in whatever
/// threads they run. Each returns the code that it has for a camera which does not answer in time, and undoes what it
/// undoes then; a stop still sends TEARDOWN and does not wait for the answer. LastFailure says that it was a cancel.
/// What begins afterwards is not affected, and neither is video that plays. One call of the system's, no wait.
///
/// Any thread; not for signal handlers. The driver exists until the call has returned: to destroy it meanwhile is an
/// error of the host. After a fork only the process that forked may use its drivers.
VEXA_API void Cancel(CVexaCommon& driver) noexcept;

/// A cancel that lasts: of the drivers that are given it, from Cancel to Reset, ends what waits and what begins.
///
/// The token and its copies in drivers share one state, which lives as long as one of them. It uses one descriptor;
/// when the system has none left, waits look every 50 ms. Made by any thread; Cancel, Reset and IsCancelled may be
/// called by any thread and by a signal handler while the token exists. They neither block nor change errno. A forked
/// child shares the state with its parent.
class VEXA_API CancelToken {
 public:
  /// Not cancelled. Throws std::bad_alloc as any object of a host's may; the library itself makes none.
  CancelToken();
  ~CancelToken();
  CancelToken(const CancelToken&) = delete;
  CancelToken& operator=(const CancelToken&) = delete;

  /// Ends what waits in each of the drivers, as vexa::Cancel does, and what begins until Reset: it contacts no camera
  /// that it would have to wait for. Video that plays goes on until it is stopped.
  void Cancel() noexcept;
  /// What begins from now on waits again. What was ended stays ended.
  void Reset() noexcept;
  bool IsCancelled() const noexcept;

 private:
  friend VEXA_API void SetCancelToken(CVexaCommon& driver, const CancelToken& token) noexcept;

  const std::shared_ptr<CancelSignal> signal_;
};

/// Gives `driver` the token, in the place of the one that it had. Calls that have begun keep the one before. Any number
/// of drivers may have one token; it may be destroyed before them, and stays for them as it was then. Any thread.
VEXA_API void SetCancelToken(CVexaCommon& driver, const CancelToken& token) noexcept;

/// Takes the driver's token away; a driver without one stays as it is. Any thread.
VEXA_API void RemoveCancelToken(CVexaCommon& driver) noexcept;

}  // namespace vexa
