// SPDX-License-Identifier: Apache-2.0
// The state of a camera that stays connected. Of the library libVexaSession.
#pragma once

#include <cstdint>
#include <string>

#include "vexa/return_codes.h"

namespace vexa {

/// What a session is doing.
enum class SessionState : std::int32_t {
  kIdle = 0,        ///< not started yet
  kConnecting = 1,  ///< an attempt is under way: until the first whole picture, or until what else was asked for runs
  kLive = 2,        ///< whole pictures come
  kStalled = 3,     ///< connected, and no whole picture comes
  kWaiting = 4,     ///< for the next attempt
  kRefused = 5,     ///< the camera has answered and refused; the next attempt, if there is one, is later
  kStopped = 6      ///< for good
};

/// Why it is so. Of a live session: why the latest attempt was made, kAsked for the first.
enum class SessionCause : std::int32_t {
  kNone = 0,
  kAsked = 1,           ///< the host asked for it
  kTurn = 2,            ///< waiting: other sessions of the group connect first
  kNoAnswer = 3,        ///< nothing answers at the address
  kClosed = 4,          ///< the camera closed or reset the connection
  kFailed = 5,          ///< any other failure: see code and text
  kNoBytes = 6,         ///< stalled: nothing comes any more
  kControlOnly = 7,     ///< stalled: the camera answers requests, and sends no picture data
  kOneTrack = 8,        ///< stalled: another stream of the camera comes, and video does not
  kNoWholePicture = 9,  ///< stalled: picture data comes, and makes no whole picture
  kCredentials = 10,    ///< refused: user name and password
  kBusy = 11,           ///< refused: the camera serves as many as it can
  kNotFound = 12,       ///< refused: it has no such stream
  kUnsupported = 13,    ///< refused: it does not do what is asked for
  kOtherTrial = 14,     ///< waiting: another session is trying the same credentials
  kStreamChanged = 15,  ///< the camera has changed codec, size or clock, and the stream begins anew
  kProfile = 16         ///< refused: the profile that was named cannot be used
};

/// A state, as an event and when asked for. `size` is set by the constructor; fields are only ever added at the end.
/// Times are milliseconds on the system's monotonic clock (CLOCK_MONOTONIC), which is never set.
struct SessionStatus {
  std::uint32_t size = sizeof(SessionStatus);
  SessionState state = SessionState::kIdle;
  SessionCause cause = SessionCause::kNone;
  ELibDReturnCode code = LIBD_OK;  ///< of the operation that failed; LIBD_OK where none did
  std::uint32_t attempt = 0;       ///< counted from 1 since the session was last live; 0 before the first
  std::int64_t since = 0;          ///< the state's beginning
  std::int64_t nextAttempt = 0;    ///< when it is due; 0: none is planned
  std::uint64_t event = 0;         ///< the state's number: each change has the next, from 1; 0 before the first
  std::uint64_t missed = 0;  ///< events that the host did not get since the one before, as later ones replaced them
  std::string text;          ///< what the camera or the system gave as the reason; empty where nothing did
  /// One sentence for a person: why the session is not live, and what it does about that. Without credentials.
  std::string why;
};

}  // namespace vexa
