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

constexpr std::uint8_t kSei = 6;

std::span<const std::uint8_t> as_bytes_of(const std::string& text) {
  return {reinterpret_cast<const std::uint8_t*>(text.data()), text.size()};
}

bool is_slice_unit(const NalUnit& nal) { return nal.type >= 1 && nal.type <= 5; }

// Receivers look for parameter sets at a picture's front: the unit goes behind them.
AccessUnit with_sei(const AccessUnit& picture, const std::string& unit) {
  constexpr std::size_t kStartCode = 4;
  const auto slice = std::find_if(picture.units.begin(), picture.units.end(), is_slice_unit);
  if (slice == picture.units.end()) return picture;
  const bool four_bytes = slice->offset >= kStartCode && picture.bytes[slice->offset - kStartCode] == 0;
  const std::size_t place = slice->offset - (four_bytes ? kStartCode : kStartCode - 1);
  AccessUnit changed = picture;
  const auto inserted = as_bytes_of(unit);
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

// What some cameras put before the header of a JPEG picture: FF D8, zeros and the text.
std::vector<std::uint8_t> jpeg_user_data(const std::string& text) {
  constexpr std::size_t kText = 32;
  if (text.empty()) return {};
  std::vector<std::uint8_t> block(168);
  block[0] = 0xFF;
  block[1] = 0xD8;
  const auto bytes = as_bytes_of(text).first(std::min(text.size(), block.size() - kText));
  std::copy(bytes.begin(), bytes.end(), block.begin() + kText);
  return block;
}

bool is_mpeg4_key(const std::string& picture) {
  constexpr std::size_t kCode = 3;
  return picture.size() > kCode && (picture[kCode] == '\xb0' || picture[kCode] == '\xb3');
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

PacketisedClip::PacketisedClip(Clip clip, std::size_t max_payload) : clip_(std::move(clip)) {
  pictures_.reserve(clip_.access_units().size());
  for (const AccessUnit& access_unit : clip_.access_units()) pictures_.emplace_back(access_unit, max_payload);
}

bool PacketisedClip::packetise(std::size_t max_payload, const std::string& user_data) {
  const std::vector<std::uint8_t> block = jpeg_user_data(user_data);
  for (std::string& image : images_) {
    if (codec_ == ImageKind::kMpeg4) {
      if (is_mpeg4_key(image)) image = with_user_data(codec_, image, user_data);
      pictures_.push_back(packetise_mpeg4(as_bytes_of(image), max_payload));
      continue;
    }
    const std::optional<JpegPicture> jpeg = read_jpeg(as_bytes_of(image));
    if (!jpeg) return false;
    pictures_.push_back(packetise_jpeg(*jpeg, block, max_payload));
  }
  return true;
}

std::shared_ptr<const PacketisedClip> PacketisedClip::load(const std::string& path, std::size_t max_payload,
                                                           const std::string& user_data) {
  const auto images = ImageClip::load(path);
  if (images && images->kind() != ImageKind::kH264) {
    PacketisedClip clip(*images);
    if (!clip.packetise(max_payload, user_data)) return nullptr;
    return std::make_shared<const PacketisedClip>(std::move(clip));
  }
  const std::optional<Clip> clip = Clip::load(path);
  if (!clip) return nullptr;
  return std::make_shared<const PacketisedClip>(user_data.empty() ? *clip : with_sei_in_key_pictures(*clip, user_data),
                                                max_payload);
}

std::vector<std::uint8_t> PacketisedClip::picture(std::size_t index) const {
  if (codec_ == ImageKind::kH264) return clip_.access_units()[index].as_delivered();
  return {images_[index].begin(), images_[index].end()};
}

bool PacketisedClip::is_key(std::size_t index) const {
  if (codec_ == ImageKind::kH264) return clip_.access_units()[index].key;
  return codec_ == ImageKind::kJpeg || is_mpeg4_key(images_[index]);
}

}  // namespace vexa::camera
