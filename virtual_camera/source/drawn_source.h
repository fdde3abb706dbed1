// SPDX-License-Identifier: Apache-2.0
// Drawn pictures (codec/drawn_video.h) as a source of a stream.
#ifndef VIRTUAL_CAMERA_SOURCE_DRAWN_SOURCE_H_
#define VIRTUAL_CAMERA_SOURCE_DRAWN_SOURCE_H_

#include <cstdint>
#include <optional>

#include "virtual_camera/codec/drawn_video.h"
#include "virtual_camera/source/picture_source.h"

namespace vexa::camera {

// Owned by one stream, on its thread. Draws each picture when it is asked for.
class DrawnSource : public PictureSource {
 public:
  DrawnSource(Codec codec, const DrawnVideo& video);

  [[nodiscard]] const SourceFormat& format() const override { return format_; }
  [[nodiscard]] std::optional<SourcePicture> next() override;
  [[nodiscard]] bool ended() const override { return false; }

 private:
  const DrawnVideo video_;
  SourceFormat format_;
  std::uint64_t index_ = 0;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SOURCE_DRAWN_SOURCE_H_
