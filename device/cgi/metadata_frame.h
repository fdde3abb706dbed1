// Motion metadata: one small text a frame, with a value for each detection window.
#pragma once

#include <ctime>
#include <string_view>

#include "vexa/io_info.h"

namespace vexa {

/// Takes the values of a part's body. A value that it does not have stays as it is.
void take_metadata(std::string_view body, SLibDRawMDFrameInfo& frame);

/// Whether nothing for so long is a stream that has died: longer than the time-out, without grace.
bool metadata_stream_is_silent(std::time_t now, std::time_t last, int timeout_ms);

}  // namespace vexa
