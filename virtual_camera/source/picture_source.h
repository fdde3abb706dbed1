// SPDX-License-Identifier: Apache-2.0
// Where the pictures of a stream come from: a clip, a drawing, a scene, a card.
#ifndef VIRTUAL_CAMERA_SOURCE_PICTURE_SOURCE_H_
#define VIRTUAL_CAMERA_SOURCE_PICTURE_SOURCE_H_

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "virtual_camera/codec/image_clip.h"

namespace vexa::camera {

class PacketisedPicture;

// A coded picture for one receiver. What it points to is immutable and may be shared by any number of receivers.
struct SourcePicture {
  Codec codec = Codec::kH264;
  bool key = false;                                  // needs no picture before it
  std::shared_ptr<const std::string> bytes;          // H.264 after start codes of four bytes throughout; never null
  std::shared_ptr<const PacketisedPicture> packets;  // the same as RTP payloads, where it was cut before; else null
  std::size_t place = 0;                             // in its clip; else counted from 0
  // Both after the beginning of the source at pace 1. The second, which RTP timestamps carry, may run at another pace,
  // or backwards.
  std::chrono::nanoseconds due{0};
  std::chrono::nanoseconds stamp{0};
};

// What is known of a source's pictures before the first of them.
struct SourceFormat {
  Codec codec = Codec::kH264;
  double frames_per_second = 25;
  // Whether pictures get user data when they leave: the options', or the camera's present direction. Else they leave as
  // they are, like recordings.
  bool takes_user_data = true;
  // H.264's parameter sets, NAL units without start codes; empty: not known yet.
  std::string sequence_parameters;
  std::string picture_parameters;
};

// Made for one receiver, which owns it: each begins with its own first picture, which is a key picture. One thread at a
// time. It reads no clock: pictures carry the times they are due.
class PictureSource {
 public:
  PictureSource() = default;
  virtual ~PictureSource() = default;
  PictureSource(const PictureSource&) = delete;
  PictureSource& operator=(const PictureSource&) = delete;

  [[nodiscard]] virtual const SourceFormat& format() const = 0;
  // The next picture, in the order of `due`; none when there is none yet, or never again. It may be asked for before
  // it is due; a picture that is made from life comes when it is.
  [[nodiscard]] virtual std::optional<SourcePicture> next() = 0;
  // Whether no picture follows those handed out.
  [[nodiscard]] virtual bool ended() const = 0;
  // When next() returned none and the source has not ended: calls `ready` once, from any thread or at once, when it is
  // worth asking again. A call that the source does not outlive may be left out.
  virtual void wait(const std::function<void()>& ready) { ready(); }
};

// The time of picture `index` at a steady rate.
[[nodiscard]] std::chrono::nanoseconds steady_time(std::uint64_t index, double frames_per_second);

// The format of pictures that begin with this one.
[[nodiscard]] SourceFormat source_format(Codec codec, std::string_view first_picture, double frames_per_second);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SOURCE_PICTURE_SOURCE_H_
