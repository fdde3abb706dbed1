// SPDX-License-Identifier: Apache-2.0
// Frames of a camera's video to a picture. Needs FFmpeg's libraries: a build without them refuses.
#ifndef HOST_PICTURE_PICTURE_DECODER_H_
#define HOST_PICTURE_PICTURE_DECODER_H_

#include <cstdint>
#include <string>
#include <vector>

#include "host/base/codec.h"
#include "host/base/problem.h"
#include "host/picture/picture.h"

namespace vexa::host {

using FrameBytes = std::vector<std::uint8_t>;

// Whether this build has FFmpeg's libraries.
[[nodiscard]] bool has_ffmpeg();

// The problem of a build that lacks FFmpeg's libraries; `what` needs them, for instance "decoding H.264".
[[nodiscard]] Problem without_ffmpeg(const std::string& what);

// Decodes `frames`, which begin with a key frame and follow each other as the driver delivered them, to the picture of
// the last.
[[nodiscard]] Result<Picture> decode_picture(Codec codec, const std::vector<FrameBytes>& frames);

// What a stream states about itself.
struct StreamParameters {
  int width = 0;          // pixels, cropping applied
  int height = 0;         // pixels
  double frame_rate = 0;  // pictures a second; 0: not stated
};

// Decodes a key frame to learn its stream's parameters. Only the frame rate that H.264 states is reliable; the other
// codecs give 0.
[[nodiscard]] Result<StreamParameters> read_stream_parameters(Codec codec, const FrameBytes& key_frame);

}  // namespace vexa::host

#endif  // HOST_PICTURE_PICTURE_DECODER_H_
