// SPDX-License-Identifier: Apache-2.0
// The video codecs of cameras, and their names.
#ifndef HOST_BASE_CODEC_H_
#define HOST_BASE_CODEC_H_

#include <cstdint>
#include <optional>
#include <string_view>

namespace vexa::host {

enum class Codec { kJpeg, kMpeg4, kH264 };

// As the driver and the command line name it: "JPEG", "MPEG4" or "H.264".
[[nodiscard]] const char* name_of(Codec codec);
[[nodiscard]] std::optional<Codec> codec_named(std::string_view name);

// As a camera's list of recordings names it: "jpeg", "mpeg4" or "h264".
[[nodiscard]] std::optional<Codec> codec_listed_as(std::string_view word);

// Of a frame's type as the driver gives it, see ELibDVideoFrameType; nullopt for a type that is no picture.
[[nodiscard]] std::optional<Codec> codec_of_frame(std::int32_t frame_type);

// Whether the picture can be decoded without those before it.
[[nodiscard]] bool is_key_frame(std::int32_t frame_type);

}  // namespace vexa::host

#endif  // HOST_BASE_CODEC_H_
