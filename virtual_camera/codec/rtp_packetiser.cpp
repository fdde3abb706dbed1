// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/codec/rtp_packetiser.h"

#include <algorithm>
#include <optional>
#include <utility>

namespace vexa::camera {
namespace {

constexpr std::uint8_t kFuA = 28;
constexpr std::uint8_t kStart = 0x80;
constexpr std::uint8_t kEnd = 0x40;
constexpr std::size_t kFuHeaderSize = 2;

constexpr std::uint8_t kSei = 6;

std::span<const std::uint8_t> bytes_of(const std::string& text) {
  return {reinterpret_cast<const std::uint8_t*>(text.data()), text.size()};
}

bool is_slice_unit(const NalUnit& nal) { return nal.type >= 1 && nal.type <= 5; }

// Receivers look for parameter sets at a picture's front: the unit goes after them.
AccessUnit with_sei(const AccessUnit& picture, const std::string& unit) {
  constexpr std::size_t kStartCode = 4;
  const auto slice = std::find_if(picture.units.begin(), picture.units.end(), is_slice_unit);
  if (slice == picture.units.end()) return picture;
  const bool four_bytes = slice->offset >= kStartCode && picture.bytes[slice->offset - kStartCode] == 0;
  const std::size_t place = slice->offset - (four_bytes ? kStartCode : kStartCode - 1);
  AccessUnit changed = picture;
  const auto inserted = bytes_of(unit);
  changed.bytes.insert(changed.bytes.begin() + static_cast<std::ptrdiff_t>(place), inserted.begin(), inserted.end());
  for (NalUnit& nal : changed.units) nal.offset += nal.offset > place ? unit.size() : 0;
  const auto index = slice - picture.units.begin();
  changed.units.insert(changed.units.begin() + index, {place + kStartCode, unit.size() - kStartCode, kSei});
  return changed;
}

Clip with_sei_in_key_pictures(const Clip& clip, const std::string& text) {
  std::vector<AccessUnit> pictures = clip.access_units();
  for (AccessUnit& picture : pictures) {
    if (picture.key) picture = with_sei(picture, sei_unit(text));
  }
  return Clip(std::move(pictures));
}

ImageClip with_text_in_key_pictures(const ImageClip& clip, const std::string& text) {
  std::vector<std::string> pictures = clip.pictures();
  for (std::size_t i = 0; i < pictures.size(); ++i) {
    if (clip.is_key(i)) pictures[i] = with_user_data(clip.kind(), pictures[i], text);
  }
  return {clip.kind(), std::move(pictures)};
}

// What some cameras put before the header of a JPEG picture: FF D8, zeros and the text.
std::vector<std::uint8_t> jpeg_user_data(const std::string& text) {
  constexpr std::size_t kText = 32;
  if (text.empty()) return {};
  std::vector<std::uint8_t> block(168);
  block[0] = 0xFF;
  block[1] = 0xD8;
  const auto bytes = bytes_of(text).first(std::min(text.size(), block.size() - kText));
  std::copy(bytes.begin(), bytes.end(), block.begin() + kText);
  return block;
}

// Receivers recognise a picture's kind by its first unit, which a user-data unit must not be: a video object's code,
// which may come before any picture, is put first.
std::string mpeg4_with_text(const std::string& picture, const std::string& text) {
  static const std::string kVideoObject("\0\0\1\1", 4);
  const std::string changed = with_user_data(Codec::kMpeg4, picture, text);
  return is_key_picture(Codec::kMpeg4, picture) ? changed : kVideoObject + changed;
}

}  // namespace

PacketisedPicture::PacketisedPicture(const AccessUnit& access_unit, std::size_t max_payload) {
  bytes_.reserve(access_unit.bytes.size() + access_unit.bytes.size() / max_payload * kFuHeaderSize);
  for (const NalUnit& nal : access_unit.units) {
    const std::span<const std::uint8_t> unit = access_unit.unit(nal);
    if (unit.size() <= max_payload) {
      add_payload({}, unit);
    } else {
      add_fragments(unit, max_payload);
    }
  }
}

void PacketisedPicture::add_payload(std::span<const std::uint8_t> head, std::span<const std::uint8_t> body) {
  bytes_.insert(bytes_.end(), head.begin(), head.end());
  bytes_.insert(bytes_.end(), body.begin(), body.end());
  ends_.push_back(bytes_.size());
}

void PacketisedPicture::add_fragments(std::span<const std::uint8_t> unit, std::size_t max_payload) {
  const std::uint8_t header = unit[0];
  std::span<const std::uint8_t> rest = unit.subspan(1);
  std::uint8_t position = kStart;
  while (!rest.empty()) {
    const std::size_t size = std::min(rest.size(), max_payload - kFuHeaderSize);
    if (size == rest.size()) position |= kEnd;
    const std::uint8_t head[] = {static_cast<std::uint8_t>((header & 0xE0U) | kFuA),
                                 static_cast<std::uint8_t>(position | (header & 0x1FU))};
    add_payload(head, rest.first(size));
    rest = rest.subspan(size);
    position = 0;
  }
}

PacketisedPicture packetise_mpeg4(std::span<const std::uint8_t> picture, std::size_t max_payload) {
  PacketisedPicture packets;
  while (!picture.empty()) {
    const std::size_t size = std::min(picture.size(), max_payload);
    packets.add_payload({}, picture.first(size));
    picture = picture.subspan(size);
  }
  return packets;
}

std::optional<PacketisedPicture> packetise(Codec codec, const std::string& picture, const std::string& text,
                                           std::size_t max_payload) {
  switch (codec) {
    case Codec::kH264: {
      const Clip clip = Clip::from_annex_b(picture);
      if (clip.access_units().empty()) return std::nullopt;
      const AccessUnit& unit = clip.access_units().front();
      return PacketisedPicture(text.empty() ? unit : with_sei(unit, sei_unit(text)), max_payload);
    }
    case Codec::kMpeg4:
      return packetise_mpeg4(bytes_of(text.empty() ? picture : mpeg4_with_text(picture, text)), max_payload);
    case Codec::kJpeg:
      break;
  }
  const std::optional<JpegPicture> jpeg = read_jpeg(bytes_of(picture));
  if (!jpeg) return std::nullopt;
  return packetise_jpeg(*jpeg, jpeg_user_data(text), max_payload);
}

PacketisedClip::PacketisedClip(Clip clip, std::size_t max_payload) : clip_(std::move(clip)), images_(clip_) {
  pictures_.reserve(clip_.access_units().size());
  for (const AccessUnit& access_unit : clip_.access_units()) pictures_.emplace_back(access_unit, max_payload);
}

bool PacketisedClip::packetise_images(std::size_t max_payload, const std::string& user_data) {
  const bool in_headers = images_.kind() == Codec::kJpeg;
  for (const std::string& image : images_.pictures()) {
    auto packets = packetise(images_.kind(), image, in_headers ? user_data : "", max_payload);
    if (!packets) return false;
    pictures_.push_back(std::move(*packets));
  }
  return true;
}

std::shared_ptr<const PacketisedClip> PacketisedClip::load(const std::string& path, std::size_t max_payload,
                                                           const std::string& user_data) {
  const auto images = ImageClip::load(path);
  if (images && images->kind() != Codec::kH264) {
    const bool in_pictures = images->kind() == Codec::kMpeg4;
    PacketisedClip clip(in_pictures ? with_text_in_key_pictures(*images, user_data) : *images);
    if (!clip.packetise_images(max_payload, user_data)) return nullptr;
    return std::make_shared<const PacketisedClip>(std::move(clip));
  }
  const std::optional<Clip> clip = Clip::load(path);
  if (!clip) return nullptr;
  return std::make_shared<const PacketisedClip>(user_data.empty() ? *clip : with_sei_in_key_pictures(*clip, user_data),
                                                max_payload);
}

}  // namespace vexa::camera
