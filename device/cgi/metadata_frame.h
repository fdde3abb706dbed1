// Motion metadata: one small text a frame, with a value for each detection window.
#pragma once

#include <string_view>

#include "vexa/io_info.h"

namespace vexa {

/// Takes the values of a part's body. A value that it does not have stays as it is.
void take_metadata(std::string_view body, SLibDRawMDFrameInfo& frame);

}  // namespace vexa
