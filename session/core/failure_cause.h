// SPDX-License-Identifier: Apache-2.0
// The cause of a failed operation, in the field's terms.
#pragma once

#include <string>

#include "vexa/return_codes.h"
#include "vexa/session_status.h"

namespace vexa {

/// `text` is the driver's latest error text: the phrase of the camera's status line, or the system's own text. A camera
/// that refuses a stream leaves its reason there alone: the code is LIBD_STREAM_OPEN_FAILED for each.
SessionCause cause_of(ELibDReturnCode code, const std::string& text);

/// Whether the camera has answered and refused.
bool is_refusal(SessionCause cause);

}  // namespace vexa
