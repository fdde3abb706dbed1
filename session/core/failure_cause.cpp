// SPDX-License-Identifier: Apache-2.0
#include "session/core/failure_cause.h"

#include <algorithm>
#include <iterator>

namespace vexa {
namespace {

struct Phrase {
  const char* part;  // in small letters
  SessionCause cause;
};

// The phrases of HTTP's and RTSP's status codes, and the system's texts. The first that is found counts.
constexpr Phrase kPhrases[] = {{"unauthorized", SessionCause::kCredentials},
                               {"forbidden", SessionCause::kUnsupported},
                               {"not enough bandwidth", SessionCause::kBusy},
                               {"service unavailable", SessionCause::kBusy},
                               {"too many", SessionCause::kBusy},
                               {"not found", SessionCause::kNotFound},
                               {"no such stream", SessionCause::kNotFound},
                               {"gone", SessionCause::kNotFound},
                               {"unsupported", SessionCause::kUnsupported},
                               {"not implemented", SessionCause::kUnsupported},
                               {"not supported", SessionCause::kUnsupported},
                               {"not acceptable", SessionCause::kUnsupported},
                               {"method not", SessionCause::kUnsupported},
                               {"connection reset", SessionCause::kClosed},
                               {"broken pipe", SessionCause::kClosed},
                               {"closed", SessionCause::kClosed},
                               {"connection refused", SessionCause::kNoAnswer},
                               {"no route", SessionCause::kNoAnswer},
                               {"unreachable", SessionCause::kNoAnswer},
                               {"timed out", SessionCause::kNoAnswer},
                               {"name or service not known", SessionCause::kNoAnswer}};

bool contains(const std::string& text, const std::string& part) {
  const auto same = [](char a, char b) { return (a >= 'A' && a <= 'Z' ? static_cast<char>(a + 32) : a) == b; };
  return std::search(text.begin(), text.end(), part.begin(), part.end(), same) != text.end();
}

}  // namespace

SessionCause cause_of(ELibDReturnCode code, const std::string& text) {
  if (code == LIBD_UNAUTHORIZED) return SessionCause::kCredentials;
  const auto* found = std::find_if(std::begin(kPhrases), std::end(kPhrases),
                                   [&text](const Phrase& phrase) { return contains(text, phrase.part); });
  if (found != std::end(kPhrases)) return found->cause;
  if (code == LIBD_NOT_SUPPORTED || code == LIBD_INVALID_ARGUMENT) return SessionCause::kUnsupported;
  // An answer that never begins leaves no text.
  return code == LIBD_TIMEOUT || text.empty() ? SessionCause::kNoAnswer : SessionCause::kFailed;
}

bool is_refusal(SessionCause cause) {
  return cause == SessionCause::kCredentials || cause == SessionCause::kBusy || cause == SessionCause::kNotFound ||
         cause == SessionCause::kUnsupported || cause == SessionCause::kProfile;
}

}  // namespace vexa
