// SPDX-License-Identifier: Apache-2.0
// The pictures of a clip, at a steady rate.
#ifndef VIRTUAL_CAMERA_SOURCE_CLIP_SOURCE_H_
#define VIRTUAL_CAMERA_SOURCE_CLIP_SOURCE_H_

#include <cstdint>
#include <memory>

#include "virtual_camera/codec/rtp_packetiser.h"
#include "virtual_camera/source/picture_source.h"

namespace vexa::camera {

// Owned by one stream, on its thread. No picture is copied: those that it returns keep the clip alive.
class ClipSource : public PictureSource {
 public:
  enum class AtEnd { kStop, kStartOver };

  // The clips are not null and hold a picture. Pictures of an ImageClip come without packets.
  ClipSource(const std::shared_ptr<const PacketisedClip>& clip, double frames_per_second, AtEnd at_end);
  ClipSource(std::shared_ptr<const ImageClip> clip, double frames_per_second, AtEnd at_end);

  // The pictures leave as they are.
  void keep_as_they_are() { format_.takes_user_data = false; }

  [[nodiscard]] const SourceFormat& format() const override { return format_; }
  [[nodiscard]] std::optional<SourcePicture> next() override;
  [[nodiscard]] bool ended() const override;

 private:
  std::shared_ptr<const ImageClip> images_;
  std::shared_ptr<const PacketisedClip> packetised_;  // of the same pictures; null: not cut
  SourceFormat format_;
  AtEnd at_end_;
  std::uint64_t index_ = 0;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SOURCE_CLIP_SOURCE_H_
