// The codecs of pictures, and the camera's words for them in its settings.
#ifndef VIRTUAL_CAMERA_VALUES_CODEC_H_
#define VIRTUAL_CAMERA_VALUES_CODEC_H_

#include <optional>
#include <string_view>

namespace vexa::camera {

enum class Codec { kJpeg, kMpeg4, kH264 };

[[nodiscard]] std::string_view codec_word(Codec codec);
// nullopt for any other word, such as "off".
[[nodiscard]] std::optional<Codec> codec_of(std::string_view word);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_VALUES_CODEC_H_
