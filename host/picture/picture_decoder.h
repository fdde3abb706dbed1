// Frames of a camera's video to a picture. Needs FFmpeg's libraries: a build without them refuses.
#ifndef HOST_PICTURE_PICTURE_DECODER_H_
#define HOST_PICTURE_PICTURE_DECODER_H_

#include <cstdint>
#include <string>
#include <vector>

#include "host/base/problem.h"
#include "host/picture/picture.h"

namespace vexa::host {

using FrameBytes = std::vector<std::uint8_t>;

// Whether this build has FFmpeg's libraries.
[[nodiscard]] bool has_ffmpeg();

// The problem of a build that lacks FFmpeg's libraries; `what` needs them, for instance "decoding H.264".
[[nodiscard]] Problem without_ffmpeg(const std::string& what);

// Decodes `frames`, which begin with a key frame and follow each other as the driver handed them out, to the picture of
// the last. `codec` is the camera's name for it: "JPEG", "MPEG4" or "H.264".
[[nodiscard]] Result<Picture> decode_picture(const std::string& codec, const std::vector<FrameBytes>& frames);

}  // namespace vexa::host

#endif  // HOST_PICTURE_PICTURE_DECODER_H_
