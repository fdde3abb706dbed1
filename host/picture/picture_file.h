// SPDX-License-Identifier: Apache-2.0
// Pictures as PNG and JPEG files. Needs FFmpeg's libraries: a build without them refuses.
#ifndef HOST_PICTURE_PICTURE_FILE_H_
#define HOST_PICTURE_PICTURE_FILE_H_

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "host/picture/picture_decoder.h"

namespace vexa::host {

enum class PictureFormat { kPng, kJpeg };

// By the end of a file's name: ".png", ".jpg" or ".jpeg", in capitals too.
[[nodiscard]] std::optional<PictureFormat> picture_format_of(std::string_view file);

// The bytes of a file.
[[nodiscard]] Result<std::vector<std::uint8_t>> encode_picture(const Picture& picture, PictureFormat format);

// Whether jpeg_of() can serve this codec in this build.
[[nodiscard]] bool makes_jpeg_of(Codec codec);

// The picture of the last frame as a JPEG file, see decode_picture(). The camera's JPEG stays as it came.
[[nodiscard]] Result<std::vector<std::uint8_t>> jpeg_of(Codec codec, const std::vector<FrameBytes>& frames);

}  // namespace vexa::host

#endif  // HOST_PICTURE_PICTURE_FILE_H_
