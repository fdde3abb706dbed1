// SPDX-License-Identifier: Apache-2.0
// The states of a session, in words.
#ifndef HOST_WORDS_SESSION_WORDS_H_
#define HOST_WORDS_SESSION_WORDS_H_

#include <optional>
#include <string>

#include "host/base/problem.h"
#include "vexa/session_status.h"

namespace vexa::host {

// Such as "connecting".
[[nodiscard]] const char* word_of(SessionState state);
// In JSON's camel case, such as "noWholePicture".
[[nodiscard]] const char* word_of(SessionCause cause);

// The problem of a session that no further attempt is planned for, as nothing changes that while this program runs.
[[nodiscard]] std::optional<Problem> hopeless(const std::string& camera, const SessionStatus& status);

}  // namespace vexa::host

#endif  // HOST_WORDS_SESSION_WORDS_H_
