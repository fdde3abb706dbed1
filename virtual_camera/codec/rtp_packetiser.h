// SPDX-License-Identifier: Apache-2.0
// Pictures as RTP payloads: H.264 as single NAL units and fragmentation units FU-A (RFC 6184), MPEG-4 Visual in pieces
// (RFC 3016), JPEG as scan data after headers (RFC 2435).
#ifndef VIRTUAL_CAMERA_CODEC_RTP_PACKETISER_H_
#define VIRTUAL_CAMERA_CODEC_RTP_PACKETISER_H_

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "virtual_camera/codec/clip.h"
#include "virtual_camera/codec/image_clip.h"
#include "virtual_camera/codec/jpeg_picture.h"

namespace vexa::camera {

// The payloads of one picture, in order, packed into one block. Immutable once made; the headers are added as it
// leaves.
class PacketisedPicture {
 public:
  PacketisedPicture() = default;
  // `max_payload` is at least 3.
  PacketisedPicture(const AccessUnit& access_unit, std::size_t max_payload);

  void add_payload(std::span<const std::uint8_t> head, std::span<const std::uint8_t> body);

  [[nodiscard]] std::size_t packets() const { return ends_.size(); }
  [[nodiscard]] std::span<const std::uint8_t> payload(std::size_t packet) const {
    const std::size_t begin = packet == 0 ? 0 : ends_[packet - 1];
    return std::span(bytes_).subspan(begin, ends_[packet] - begin);
  }

 private:
  void add_fragments(std::span<const std::uint8_t> unit, std::size_t max_payload);

  std::vector<std::uint8_t> bytes_;
  std::vector<std::size_t> ends_;
};

[[nodiscard]] PacketisedPicture packetise_mpeg4(std::span<const std::uint8_t> picture, std::size_t max_payload);

// The tables go in band, after the first header. `user_data` may be empty; it comes before that header. A packet is
// larger than `max_payload` where its headers leave no room for a byte.
[[nodiscard]] PacketisedPicture packetise_jpeg(const JpegPicture& picture, std::span<const std::uint8_t> user_data,
                                               std::size_t max_payload);

// A picture of any codec, with a text in its user data where that is not empty: before the first slice of H.264 a SEI
// unit, before the coded MPEG-4 picture a user-data unit, before the first JPEG header a block. Nothing for one that
// RTP cannot carry.
[[nodiscard]] std::optional<PacketisedPicture> packetise(Codec codec, const std::string& picture,
                                                         const std::string& text, std::size_t max_payload);

// A clip cut into packets once, for any number of cameras and clients. Immutable and shared.
class PacketisedClip {
 public:
  PacketisedClip(Clip clip, std::size_t max_payload);
  // Of an Annex-B file, whatever its name, or of a JPEG or MPEG-4 file as ImageClip reads it. Null when it cannot be
  // read, holds no picture, or one that RTP cannot carry. The text, where there is one, goes into the user data of key
  // pictures: a SEI unit before the first slice, a user-data unit before the plane, a block before the JPEG header.
  [[nodiscard]] static std::shared_ptr<const PacketisedClip> load(const std::string& path, std::size_t max_payload,
                                                                  const std::string& user_data = {});

  [[nodiscard]] Codec codec() const { return images_.kind(); }
  // H.264 as a receiver rebuilds it, MPEG-4 as it is sent, JPEG as the encoder made it.
  [[nodiscard]] const ImageClip& images() const { return images_; }
  [[nodiscard]] const Clip& clip() const { return clip_; }  // H.264; empty for other codecs
  [[nodiscard]] const std::vector<PacketisedPicture>& pictures() const { return pictures_; }
  [[nodiscard]] const std::string& picture(std::size_t index) const { return images_.pictures()[index]; }
  [[nodiscard]] bool is_key(std::size_t index) const { return images_.is_key(index); }

 private:
  explicit PacketisedClip(ImageClip images) : images_(std::move(images)) {}
  [[nodiscard]] bool packetise_images(std::size_t max_payload, const std::string& user_data);

  Clip clip_;
  ImageClip images_;
  std::vector<PacketisedPicture> pictures_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_CODEC_RTP_PACKETISER_H_
