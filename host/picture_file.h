// Pictures as PNG and JPEG files. Needs FFmpeg's libraries: a build without them refuses.
#ifndef HOST_PICTURE_FILE_H_
#define HOST_PICTURE_FILE_H_

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "host/picture.h"
#include "host/problem.h"

namespace vexa::host {

enum class PictureFormat { kPng, kJpeg };

// By the end of a file's name: ".png", ".jpg" or ".jpeg", in capitals too.
[[nodiscard]] std::optional<PictureFormat> picture_format_of(std::string_view file);

// The file's bytes.
[[nodiscard]] Result<std::vector<std::uint8_t>> encode_picture(const Picture& picture, PictureFormat format);

}  // namespace vexa::host

#endif  // HOST_PICTURE_FILE_H_
