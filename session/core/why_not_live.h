// SPDX-License-Identifier: Apache-2.0
// A session's state as one sentence for a person.
#pragma once

#include <string>

#include "session/core/moment.h"
#include "vexa/session_status.h"

namespace vexa {

/// For instance "No answer from the camera (Connection refused); the next attempt is in 4 s." A live session has
/// "Live."; a stalled one was silent from `since` on. The text of the camera is cut to one line of 200 characters.
std::string why_not_live(const SessionStatus& status, Moment now);

}  // namespace vexa
