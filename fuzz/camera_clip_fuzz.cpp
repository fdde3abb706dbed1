// SPDX-License-Identifier: Apache-2.0
// Files of pictures that the virtual camera sends: however they are cut, no byte is read twice and none is invented.
#include <string>
#include <vector>

#include "fuzz/check.h"
#include "virtual_camera/codec/clip.h"
#include "virtual_camera/codec/image_clip.h"
#include "virtual_camera/codec/jpeg_picture.h"

namespace {

using vexa_fuzz::check;
namespace camera = vexa::camera;

void read_annex_b(std::string_view file) {
  const camera::Clip clip = camera::Clip::from_annex_b(file);
  std::size_t bytes = 0;
  for (const camera::AccessUnit& picture : clip.access_units()) {
    bytes += picture.bytes.size();
    for (const camera::NalUnit& unit : picture.units) check(unit.offset + unit.size <= picture.bytes.size());
    static_cast<void>(picture.as_delivered());
  }
  check(bytes <= file.size());
}

void read_pictures(camera::Codec codec, const std::vector<std::string>& pictures, std::string_view file) {
  std::size_t bytes = 0;
  for (const std::string& picture : pictures) {
    check(file.find(picture) != std::string_view::npos);
    bytes += picture.size();
    static_cast<void>(camera::is_key_picture(codec, picture));
    check(camera::with_user_data(codec, picture, "").size() == picture.size());
    check(camera::with_user_data(codec, picture, "text").size() >= picture.size());
  }
  check(bytes <= file.size());
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view file = vexa_fuzz::text_of(data, size);
  read_annex_b(file);
  read_pictures(camera::Codec::kJpeg, camera::cut_jpeg(file), file);
  read_pictures(camera::Codec::kMpeg4, camera::cut_mpeg4(file), file);
  static_cast<void>(camera::read_jpeg({data, size}));
  return 0;
}
