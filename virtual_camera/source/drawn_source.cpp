// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/source/drawn_source.h"

#include <memory>
#include <string>

namespace vexa::camera {
namespace {

std::string draw(Codec codec, const DrawnVideo& video, std::uint64_t index) {
  switch (codec) {
    case Codec::kH264:
      return draw_h264(video, index);
    case Codec::kMpeg4:
      return draw_mpeg4(video, index);
    case Codec::kJpeg:
      break;
  }
  return draw_jpeg(video, index);
}

}  // namespace

DrawnSource::DrawnSource(Codec codec, const DrawnVideo& video)
    : video_(video), format_(source_format(codec, draw(codec, video, 0), video.frame_rate)) {}

std::optional<SourcePicture> DrawnSource::next() {
  SourcePicture picture;
  picture.codec = format_.codec;
  picture.key = picture.codec == Codec::kJpeg || index_ % static_cast<std::uint64_t>(video_.frame_rate) == 0;
  picture.bytes = std::make_shared<const std::string>(draw(picture.codec, video_, index_));
  picture.place = static_cast<std::size_t>(index_);
  picture.due = picture.stamp = steady_time(index_, format_.frames_per_second);
  ++index_;
  return picture;
}

}  // namespace vexa::camera
