// Which of the camera's video streams a start opens.
#pragma once

#include "vexa/export.h"
#include "vexa/return_codes.h"

class CVexaCommon;

namespace vexa {

/// Chooses the video stream, from 1, that the next StartVideoStreaming opens, and reads that stream's settings from the
/// camera: the "camera" inquiry, no request that changes the camera. A stream that plays goes on as it was opened.
///
/// LIBD_OK; LIBD_INVALID_ARGUMENT below 1, with no request; LIBD_NOT_SUPPORTED when the camera reports no codec for
/// such a stream; else the code of the inquiry's failure. The choice and the settings stay as they were unless it is
/// LIBD_OK. Blocks for the connection's time-out at most twice. Any thread.
VEXA_API ELibDReturnCode SelectStream(CVexaCommon& driver, int stream) noexcept;

}  // namespace vexa
