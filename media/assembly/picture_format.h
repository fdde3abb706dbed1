// What in a frame gives its picture's format.
#pragma once

#include <cstdint>

#include "media/assembly/codec.h"
#include "runtime/base/bytes.h"

namespace vexa {

/// A number that changes with the picture's format: of JPEG its width and height, of H.264 and MPEG-4 what stands in
/// the sequence parameter set or the sequence header. 0 for a frame that does not give it.
std::uint64_t picture_format(CodecKind codec, Bytes frame);

}  // namespace vexa
