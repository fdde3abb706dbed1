// CVexaCommon: frames from the camera's HTTP image stream.
#include "vexa/vexa_common.h"

// No codec is offered on this way yet.
ELibDReturnCode CVexaCommon::GetCurrentFrameData(VideoFrameInfo&) { return LIBD_FAILED; }
