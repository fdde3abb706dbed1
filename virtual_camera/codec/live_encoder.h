// SPDX-License-Identifier: Apache-2.0
// Pictures to JPEG, MPEG-4 Visual or H.264 as they are made, one access unit a picture.
#ifndef VIRTUAL_CAMERA_CODEC_LIVE_ENCODER_H_
#define VIRTUAL_CAMERA_CODEC_LIVE_ENCODER_H_

#include <cstdint>
#include <memory>
#include <string>
#include <variant>
#include <vector>

#include "virtual_camera/codec/i420_picture.h"
#include "virtual_camera/values/codec.h"

namespace vexa::camera {

struct LiveEncoding {
  Codec codec = Codec::kH264;
  int width = 0;  // pixels, even
  int height = 0;
  int frame_rate = 25;   // pictures a second
  int bit_rate = 2000;   // kbit/s; not JPEG's
  int quality = 5;       // JPEG's: 1 to 10, the best
  int key_interval = 0;  // pictures from key picture to key picture; 0: a second of them

  bool operator==(const LiveEncoding&) const = default;
};

struct EncodedPicture {
  // JPEG: a whole file that RTP can carry (RFC 2435), for sides that are multiples of 8. H.264: Annex B with start
  // codes of four bytes; MPEG-4: start codes too. Key pictures begin with the parameter sets or headers. No user data.
  std::vector<std::uint8_t> bytes;
  bool key = false;
};

// Whether this build has encoders: builds without FFmpeg's libraries do not, and open() then reports it.
[[nodiscard]] bool has_live_encoders();

// Owned by a LiveVideo and used on its thread. Keeps the state between pictures that delta pictures need.
class LiveEncoder {
 public:
  // The encoder, or why there is none.
  [[nodiscard]] static std::variant<LiveEncoder, std::string> open(const LiveEncoding& encoding);
  LiveEncoder(LiveEncoder&&) noexcept;
  LiveEncoder& operator=(LiveEncoder&&) noexcept;
  ~LiveEncoder();

  // The picture's access unit, or what went wrong; a picture of another size is refused, and the encoder stays as it
  // was.
  [[nodiscard]] std::variant<EncodedPicture, std::string> encode(const I420Picture& picture);
  // The next picture becomes a key picture, as for somebody who has just come.
  void ask_for_key();

 private:
  struct Parts;
  explicit LiveEncoder(std::unique_ptr<Parts> parts);

  std::unique_ptr<Parts> parts_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_CODEC_LIVE_ENCODER_H_
