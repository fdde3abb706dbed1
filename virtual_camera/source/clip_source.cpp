// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/source/clip_source.h"

#include <utility>

namespace vexa::camera {

ClipSource::ClipSource(std::shared_ptr<const ImageClip> clip, double frames_per_second, AtEnd at_end)
    : images_(std::move(clip)),
      format_(source_format(images_->kind(), images_->pictures().front(), frames_per_second)),
      at_end_(at_end) {}

ClipSource::ClipSource(const std::shared_ptr<const PacketisedClip>& clip, double frames_per_second, AtEnd at_end)
    : ClipSource(std::shared_ptr<const ImageClip>(clip, &clip->images()), frames_per_second, at_end) {
  packetised_ = clip;
}

bool ClipSource::ended() const { return at_end_ == AtEnd::kStop && index_ >= images_->pictures().size(); }

std::optional<SourcePicture> ClipSource::next() {
  if (ended()) return std::nullopt;
  SourcePicture picture;
  picture.place = static_cast<std::size_t>(index_ % images_->pictures().size());
  picture.codec = format_.codec;
  picture.key = images_->is_key(picture.place);
  picture.bytes = {images_, &images_->pictures()[picture.place]};
  if (packetised_) picture.packets = {packetised_, &packetised_->pictures()[picture.place]};
  picture.due = picture.stamp = steady_time(index_++, format_.frames_per_second);
  return picture;
}

}  // namespace vexa::camera
