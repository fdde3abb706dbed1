// SPDX-License-Identifier: Apache-2.0
// The pictures of a recording, at the pace and in the direction that a host asks for.
#ifndef VIRTUAL_CAMERA_CARD_CARD_SOURCE_H_
#define VIRTUAL_CAMERA_CARD_CARD_SOURCE_H_

#include <cstddef>
#include <optional>
#include <vector>

#include "virtual_camera/card/card.h"
#include "virtual_camera/source/picture_source.h"

namespace vexa::camera {

// Forward, pictures carry the times they were stored at, whatever the pace. Backward there are key pictures alone, and
// they carry the time that the playback has run, since times on the wire only go forward. Ends when the card has no
// longer what it plays.
class CardSource : public PictureSource {
 public:
  // `card` outlives it; the recording holds a picture; `scale` is not 0.
  CardSource(const Card& card, Recording recording, int scale);

  [[nodiscard]] const SourceFormat& format() const override { return format_; }
  [[nodiscard]] std::optional<SourcePicture> next() override;
  [[nodiscard]] bool ended() const override;

 private:
  const Card& card_;
  Recording recording_;  // its pictures in the order of the playback
  const int scale_;
  SourceFormat format_;
  std::size_t next_ = 0;
};

// The scale nearest to the one asked for of those that a camera offers; 1 when it offers none.
[[nodiscard]] int offered_scale(const std::vector<int>& offered, int asked);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_CARD_CARD_SOURCE_H_
