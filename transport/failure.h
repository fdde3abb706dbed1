// SPDX-License-Identifier: Apache-2.0
// What can go wrong on the wire, each code and text in one place.
#pragma once

#include <cerrno>
#include <cstring>

#include "runtime/base/result.h"

namespace vexa {

inline constexpr KnownFailure kConnectTimedOut{LIBD_TIMEOUT, "Connection timed out"};
inline constexpr KnownFailure kReceiveTimedOut{LIBD_TIMEOUT, "Receive timed out"};
inline constexpr KnownFailure kStrangeStatus{LIBD_FAILED, "Strange status"};
inline constexpr KnownFailure kInvalidArgument{LIBD_FAILED, "Invalid argument"};
inline constexpr KnownFailure kUrlTooLong{LIBD_FAILED, "URL too long"};
inline constexpr KnownFailure kStatusNotFound{LIBD_FAILED, "Status not found"};
inline constexpr KnownFailure kClockNotFound{LIBD_FAILED, "clock= not found"};
inline constexpr KnownFailure kUnknownClock{LIBD_FAILED, "unknown clock format"};
inline constexpr KnownFailure kRtpmapNotFound{LIBD_FAILED, "rtpmap: not found"};
inline constexpr KnownFailure kRtpmapSlashNotFound{LIBD_FAILED, "rtpmap:'/' not found"};
inline constexpr KnownFailure kClockUnitNotFound{LIBD_FAILED, "clock_unit not found"};
inline constexpr KnownFailure kSessionNotFound{LIBD_FAILED, "Session not found"};
inline constexpr KnownFailure kConnectionClosed{LIBD_FAILED, "Connection closed"};
inline constexpr KnownFailure kNoDollar{LIBD_FAILED, "ASCII dollar not found"};
inline constexpr KnownFailure kRtpVersion{LIBD_FAILED, "Invalid RTP version"};
inline constexpr KnownFailure kPayloadLength{LIBD_FAILED, "Invalid payload length"};
inline constexpr KnownFailure kDataLenNotFound{LIBD_FAILED, "DataLen not found"};
inline constexpr KnownFailure kBufferTooSmall{LIBD_FAILED, "Buffer too small"};
inline constexpr KnownFailure kKeepAliveTooLong{LIBD_FAILED, "URL too long\n"};

/// A failure that leaves the latest text as it is: the peer closed early, or the wait was ended from this side.
inline constexpr KnownFailure kNoReason{};

/// The system's text for an error number.
inline Failure system_failure(int error = errno) {
  char text[256];
  // The GNU form: returns where the text is.
  return {LIBD_FAILED, strerror_r(error, text, sizeof text)};
}

/// Why a wait did not answer 1: `expired` for 0, errno's text for -1.
inline Failure wait_failure(int answer, const KnownFailure& expired) {
  if (answer == 0) return expired;
  if (answer == -1) return system_failure();
  return kStrangeStatus;
}

}  // namespace vexa
