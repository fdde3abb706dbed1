// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/card/card_source.h"

#include <algorithm>
#include <cstdlib>
#include <utility>

namespace vexa::camera {
namespace {

// What is played backward: key pictures, the last one first, each as long after it as it was before it.
std::vector<StoredPicture> turned(const Recording& recording) {
  std::vector<StoredPicture> pictures;
  for (const StoredPicture& picture : recording.pictures) {
    if (!picture.key) continue;
    pictures.push_back(picture);
  }
  std::reverse(pictures.begin(), pictures.end());
  if (pictures.empty()) return pictures;
  const std::chrono::microseconds last = pictures.front().at;
  for (StoredPicture& picture : pictures) picture.at = last - picture.at;
  return pictures;
}

}  // namespace

CardSource::CardSource(const Card& card, Recording recording, int scale)
    : card_(card),
      recording_(std::move(recording)),
      scale_(scale),
      format_(source_format(recording_.head.codec, *recording_.pictures.front().bytes,
                            std::max(recording_.head.frame_rate, 1) * std::abs(scale))) {
  format_.takes_user_data = false;
  if (scale_ < 0) recording_.pictures = turned(recording_);
}

bool CardSource::ended() const { return next_ == recording_.pictures.size() || !card_.holds(recording_.name); }

std::optional<SourcePicture> CardSource::next() {
  if (ended()) return std::nullopt;
  const StoredPicture& stored = recording_.pictures[next_];
  SourcePicture picture;
  picture.codec = recording_.head.codec;
  picture.key = stored.key;
  picture.bytes = stored.bytes;
  picture.place = next_++;
  picture.due = std::chrono::nanoseconds(stored.at) / std::abs(scale_);
  picture.stamp = stored.at;
  return picture;
}

int offered_scale(const std::vector<int>& offered, int asked) {
  const auto distance = [asked](int scale) { return std::llabs(static_cast<long long>(scale) - asked); };
  const auto nearest =
      std::min_element(offered.begin(), offered.end(), [&](int a, int b) { return distance(a) < distance(b); });
  return nearest == offered.end() ? 1 : *nearest;
}

}  // namespace vexa::camera
