#include "virtual_camera/rtp_packetiser.h"

#include <algorithm>
#include <optional>
#include <utility>

namespace vexa::camera {
namespace {

constexpr std::uint8_t kFuA = 28;
constexpr std::uint8_t kStart = 0x80;
constexpr std::uint8_t kEnd = 0x40;
constexpr std::size_t kFuHeaderSize = 2;

}  // namespace

PacketisedPicture::PacketisedPicture(const AccessUnit& access_unit, std::size_t max_payload) {
  bytes_.reserve(access_unit.bytes.size() + access_unit.bytes.size() / max_payload * kFuHeaderSize);
  for (const NalUnit& nal : access_unit.units) {
    const std::span<const std::uint8_t> unit = access_unit.unit(nal);
    if (unit.size() <= max_payload) {
      add_single(unit);
    } else {
      add_fragments(unit, max_payload);
    }
  }
}

void PacketisedPicture::add_single(std::span<const std::uint8_t> unit) {
  bytes_.insert(bytes_.end(), unit.begin(), unit.end());
  ends_.push_back(bytes_.size());
}

void PacketisedPicture::add_fragments(std::span<const std::uint8_t> unit, std::size_t max_payload) {
  const std::uint8_t header = unit[0];
  std::span<const std::uint8_t> rest = unit.subspan(1);
  std::uint8_t position = kStart;
  while (!rest.empty()) {
    const std::size_t size = std::min(rest.size(), max_payload - kFuHeaderSize);
    if (size == rest.size()) position |= kEnd;
    bytes_.push_back(static_cast<std::uint8_t>((header & 0xE0U) | kFuA));
    bytes_.push_back(static_cast<std::uint8_t>(position | (header & 0x1FU)));
    add_single(rest.first(size));
    rest = rest.subspan(size);
    position = 0;
  }
}

PacketisedClip::PacketisedClip(Clip clip, std::size_t max_payload) : clip_(std::move(clip)) {
  pictures_.reserve(clip_.access_units().size());
  for (const AccessUnit& access_unit : clip_.access_units()) pictures_.emplace_back(access_unit, max_payload);
}

std::shared_ptr<const PacketisedClip> PacketisedClip::load(const std::string& path, std::size_t max_payload) {
  std::optional<Clip> clip = Clip::load(path);
  if (!clip) return nullptr;
  return std::make_shared<const PacketisedClip>(std::move(*clip), max_payload);
}

}  // namespace vexa::camera
