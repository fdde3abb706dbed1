// What can go wrong on the wire, each code and text in one place.
#pragma once

#include "vexa/return_codes.h"

namespace vexa {

/// A failure as the latest error records it. LIBD_FAILED leaves the code of the exchange as it is (0 from its start).
struct Failure {
  ELibDReturnCode code = LIBD_FAILED;
  const char* text = "";
};

inline constexpr Failure kConnectTimedOut{LIBD_TIMEOUT, "Connection timed out"};
inline constexpr Failure kReceiveTimedOut{LIBD_TIMEOUT, "Receive timed out"};
inline constexpr Failure kStrangeStatus{LIBD_FAILED, "Strange status"};
inline constexpr Failure kInvalidArgument{LIBD_FAILED, "Invalid argument"};
inline constexpr Failure kUrlTooLong{LIBD_FAILED, "URL too long"};
inline constexpr Failure kStatusNotFound{LIBD_FAILED, "Status not found"};
inline constexpr Failure kClockNotFound{LIBD_FAILED, "clock= not found"};
inline constexpr Failure kUnknownClock{LIBD_FAILED, "unknown clock format"};
inline constexpr Failure kRtpmapNotFound{LIBD_FAILED, "rtpmap: not found"};
inline constexpr Failure kRtpmapSlashNotFound{LIBD_FAILED, "rtpmap:'/' not found"};
inline constexpr Failure kClockUnitNotFound{LIBD_FAILED, "clock_unit not found"};
inline constexpr Failure kSessionNotFound{LIBD_FAILED, "Session not found"};
inline constexpr Failure kConnectionClosed{LIBD_FAILED, "Connection closed"};
inline constexpr Failure kNoDollar{LIBD_FAILED, "ASCII dollar not found"};
inline constexpr Failure kRtpVersion{LIBD_FAILED, "Invalid RTP version"};
inline constexpr Failure kPayloadLength{LIBD_FAILED, "Invalid payload length"};
inline constexpr Failure kDataLenNotFound{LIBD_FAILED, "DataLen not found"};
inline constexpr Failure kBufferTooSmall{LIBD_FAILED, "Buffer too small"};
inline constexpr Failure kKeepAliveTooLong{LIBD_FAILED, "URL too long\n"};

}  // namespace vexa
