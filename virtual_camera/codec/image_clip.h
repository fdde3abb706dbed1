// SPDX-License-Identifier: Apache-2.0
// What the camera's HTTP image streams send: pictures of JPEG, H.264 or MPEG-4, and sound.
#ifndef VIRTUAL_CAMERA_CODEC_IMAGE_CLIP_H_
#define VIRTUAL_CAMERA_CODEC_IMAGE_CLIP_H_

#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "virtual_camera/values/codec.h"

namespace vexa::camera {

class Clip;

// A clip cut into pictures, held in memory. Immutable, shared by any number of cameras.
class ImageClip {
 public:
  // Known by its extension: ".mjpeg" (JPEG pictures one after the other), ".h264" (Annex B) or ".m4v" (MPEG-4 Visual).
  // Null when the file cannot be read, is of no such kind, or holds no picture.
  [[nodiscard]] static std::shared_ptr<const ImageClip> load(const std::string& path);

  ImageClip(Codec kind, std::vector<std::string> pictures);
  explicit ImageClip(const Clip& clip);  // H.264

  [[nodiscard]] Codec kind() const { return kind_; }
  // H.264 pictures have start codes of four bytes throughout.
  [[nodiscard]] const std::vector<std::string>& pictures() const { return pictures_; }
  [[nodiscard]] bool is_key(std::size_t picture) const { return keys_[picture]; }

 private:
  Codec kind_;
  std::vector<std::string> pictures_;
  std::vector<bool> keys_;
};

// Whether a picture needs none before it: every JPEG picture, of H.264 one with an IDR slice, of MPEG-4 one that a
// sequence or a group begins with.
[[nodiscard]] bool is_key_picture(Codec kind, std::string_view picture);

// The picture with a text in its user data, where cameras of the kind have it: a comment of a JPEG picture, an SEI unit
// in front of an H.264 picture, a user-data unit in front of the coded MPEG-4 picture. Unchanged without a text.
[[nodiscard]] std::string with_user_data(Codec kind, const std::string& picture, std::string_view text);

// A SEI unit of unregistered user data (ITU-T H.264, D.1.7) that holds the text, after a start code of four bytes.
[[nodiscard]] std::string sei_unit(std::string_view text);

// The pictures of a file of each kind.
[[nodiscard]] std::vector<std::string> cut_jpeg(std::string_view bytes);
[[nodiscard]] std::vector<std::string> cut_mpeg4(std::string_view bytes);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_CODEC_IMAGE_CLIP_H_
