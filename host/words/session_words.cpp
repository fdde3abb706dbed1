// SPDX-License-Identifier: Apache-2.0
#include "host/words/session_words.h"

#include <fmt/format.h>

#include "host/base/printable.h"

namespace vexa::host {

const char* word_of(SessionState state) {
  switch (state) {
    case SessionState::kIdle:
      return "idle";
    case SessionState::kConnecting:
      return "connecting";
    case SessionState::kLive:
      return "live";
    case SessionState::kStalled:
      return "stalled";
    case SessionState::kWaiting:
      return "waiting";
    case SessionState::kRefused:
      return "refused";
    case SessionState::kStopped:
      return "stopped";
  }
  return "";
}

const char* word_of(SessionCause cause) {
  switch (cause) {
    case SessionCause::kNone:
      return "none";
    case SessionCause::kAsked:
      return "asked";
    case SessionCause::kTurn:
      return "turn";
    case SessionCause::kNoAnswer:
      return "noAnswer";
    case SessionCause::kClosed:
      return "closed";
    case SessionCause::kFailed:
      return "failed";
    case SessionCause::kNoBytes:
      return "noBytes";
    case SessionCause::kControlOnly:
      return "controlOnly";
    case SessionCause::kOneTrack:
      return "oneTrack";
    case SessionCause::kNoWholePicture:
      return "noWholePicture";
    case SessionCause::kCredentials:
      return "credentials";
    case SessionCause::kBusy:
      return "busy";
    case SessionCause::kNotFound:
      return "notFound";
    case SessionCause::kUnsupported:
      return "unsupported";
    case SessionCause::kOtherTrial:
      return "otherTrial";
    case SessionCause::kStreamChanged:
      return "streamChanged";
    case SessionCause::kProfile:
      return "profile";
  }
  return "";
}

std::optional<Problem> hopeless(const std::string& camera, const SessionStatus& status) {
  if (status.state != SessionState::kRefused || status.nextAttempt != 0) return std::nullopt;
  const std::string sentence = printable(status.why);
  const std::string text = fmt::format("{}: {}", camera, sentence.substr(0, sentence.find_last_not_of('.') + 1));
  if (status.cause == SessionCause::kCredentials) {
    return Problem{ExitCode::kUnauthorized, text,
                   "Give user name and password with --credentials, or in the file of cameras."};
  }
  if (status.cause == SessionCause::kProfile) {
    return Problem{ExitCode::kUsage, text, "vexactl profile list shows the profiles that are installed."};
  }
  return Problem{ExitCode::kUnreachable, text, "Check address, power, network and the camera's settings."};
}

}  // namespace vexa::host
