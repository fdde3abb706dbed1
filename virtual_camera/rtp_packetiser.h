// H.264 access units as RTP payloads (RFC 6184): single NAL units, and fragmentation units (FU-A) for what is larger.
#ifndef VIRTUAL_CAMERA_RTP_PACKETISER_H_
#define VIRTUAL_CAMERA_RTP_PACKETISER_H_

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <vector>

#include "virtual_camera/clip.h"

namespace vexa::camera {

// The payloads of one access unit, in order, packed into one block.
class PacketisedPicture {
 public:
  // `max_payload` is at least 3.
  PacketisedPicture(const AccessUnit& access_unit, std::size_t max_payload);

  [[nodiscard]] std::size_t packets() const { return ends_.size(); }
  [[nodiscard]] std::span<const std::uint8_t> payload(std::size_t packet) const {
    const std::size_t begin = packet == 0 ? 0 : ends_[packet - 1];
    return std::span(bytes_).subspan(begin, ends_[packet] - begin);
  }

 private:
  void add_single(std::span<const std::uint8_t> unit);
  void add_fragments(std::span<const std::uint8_t> unit, std::size_t max_payload);

  std::vector<std::uint8_t> bytes_;
  std::vector<std::size_t> ends_;
};

// A clip cut into packets once, for any number of cameras and clients. Immutable.
class PacketisedClip {
 public:
  PacketisedClip(Clip clip, std::size_t max_payload);
  // Null when the file cannot be read or holds no access unit.
  [[nodiscard]] static std::shared_ptr<const PacketisedClip> load(const std::string& path, std::size_t max_payload);

  [[nodiscard]] const Clip& clip() const { return clip_; }
  [[nodiscard]] const std::vector<PacketisedPicture>& pictures() const { return pictures_; }

 private:
  Clip clip_;
  std::vector<PacketisedPicture> pictures_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_RTP_PACKETISER_H_
