// SPDX-License-Identifier: Apache-2.0
#include "session/core/why_not_live.h"

#include <algorithm>
#include <chrono>

namespace vexa {
namespace {

constexpr std::size_t kLongestText = 200;

const char* sentence_of(SessionCause cause) {
  switch (cause) {
    case SessionCause::kNone:
    case SessionCause::kAsked:
      return "The host has asked for it";
    case SessionCause::kTurn:
      return "Other cameras of the group connect first";
    case SessionCause::kNoAnswer:
      return "No answer from the camera";
    case SessionCause::kClosed:
      return "The camera has closed the connection";
    case SessionCause::kFailed:
      return "The camera cannot be used";
    case SessionCause::kNoBytes:
      return "The camera has stopped sending";
    case SessionCause::kControlOnly:
      return "The camera answers, but sends no picture data";
    case SessionCause::kOneTrack:
      return "The camera sends another of its streams, but no video";
    case SessionCause::kNoWholePicture:
      return "Picture data comes, but no whole picture";
    case SessionCause::kCredentials:
      return "The camera refuses user name and password";
    case SessionCause::kBusy:
      return "The camera serves as many as it can";
    case SessionCause::kNotFound:
      return "The camera has no such stream";
    case SessionCause::kUnsupported:
      return "The camera does not do what is asked for";
    case SessionCause::kOtherTrial:
      return "Another session is trying the same credentials";
    case SessionCause::kStreamChanged:
      return "The camera has changed its stream";
    case SessionCause::kProfile:
      return "The camera's profile cannot be used";
  }
  return "The cause is not known";
}

std::string in_brackets(const std::string& text) {
  std::string line = text.substr(0, std::min(text.find_first_of("\r\n"), kLongestText));
  for (char& letter : line) {
    if (static_cast<unsigned char>(letter) < ' ' || letter == 0x7f) letter = '?';
  }
  return line.empty() ? "" : " (" + line + ")";
}

// Whole seconds, rounded up: what is still due is never reported as 0 s.
std::string seconds_until(std::int64_t moment, Moment now) {
  const std::int64_t left = std::max<std::int64_t>(moment - now.count(), 1);
  return std::to_string((left + 999) / 1000) + " s";
}

std::string next_of(const SessionStatus& status, Moment now) {
  if (status.nextAttempt == 0) {
    return status.cause == SessionCause::kCredentials
               ? "; no attempt is planned until they change or the host asks for one."
               : ".";
  }
  return "; the next attempt is in " + seconds_until(status.nextAttempt, now) + ".";
}

}  // namespace

std::string why_not_live(const SessionStatus& status, Moment now) {
  const std::string cause = sentence_of(status.cause) + in_brackets(status.text);
  switch (status.state) {
    case SessionState::kIdle:
      return "The session has not been started.";
    case SessionState::kConnecting:
      return "Attempt " + std::to_string(status.attempt) + " to connect is under way.";
    case SessionState::kLive:
      return "Live.";
    case SessionState::kStalled:
      return cause + ", for " + std::to_string((now.count() - status.since) / 1000) + " s.";
    case SessionState::kWaiting:
    case SessionState::kRefused:
      return cause + next_of(status, now);
    case SessionState::kStopped:
      return "The session was stopped.";
  }
  return "";
}

}  // namespace vexa
