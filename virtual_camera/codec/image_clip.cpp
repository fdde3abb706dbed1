// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/codec/image_clip.h"

#include <cstdint>
#include <fstream>
#include <iterator>
#include <optional>
#include <utility>

#include "virtual_camera/codec/clip.h"

namespace vexa::camera {
namespace {

constexpr std::size_t kMarkerSize = 2;

unsigned byte_at(std::string_view bytes, std::size_t at) {
  return at < bytes.size() ? static_cast<unsigned char>(bytes[at]) : 0U;
}

std::string two_bytes(std::size_t number) {
  return {static_cast<char>(number >> 8 & 0xff), static_cast<char>(number & 0xff)};
}

// Where the scan of a JPEG picture begins: after the segments in front of it (ITU-T T.81, B.1.1.4).
std::optional<std::size_t> scan_of(std::string_view bytes, std::size_t begin) {
  constexpr unsigned kStartOfScan = 0xda;
  std::size_t at = begin + kMarkerSize;
  while (byte_at(bytes, at) == 0xff) {
    const unsigned marker = byte_at(bytes, at + 1);
    at += kMarkerSize + (byte_at(bytes, at + 2) << 8 | byte_at(bytes, at + 3));
    if (at >= bytes.size()) return std::nullopt;
    if (marker == kStartOfScan) return at;
  }
  return std::nullopt;
}

}  // namespace

ImageClip::ImageClip(Codec kind, std::vector<std::string> pictures) : kind_(kind), pictures_(std::move(pictures)) {
  for (const std::string& picture : pictures_) keys_.push_back(is_key_picture(kind_, picture));
}

ImageClip::ImageClip(const Clip& clip) : kind_(Codec::kH264), pictures_(clip.delivered()) {
  for (const AccessUnit& picture : clip.access_units()) keys_.push_back(picture.key);
}

std::shared_ptr<const ImageClip> ImageClip::load(const std::string& path) {
  const struct {
    std::string_view extension;
    ImageClip (*cut)(std::string_view);
  } kinds[] = {{".mjpeg", [](std::string_view bytes) { return ImageClip(Codec::kJpeg, cut_jpeg(bytes)); }},
               {".h264", [](std::string_view bytes) { return ImageClip(Clip::from_annex_b(bytes)); }},
               {".m4v", [](std::string_view bytes) { return ImageClip(Codec::kMpeg4, cut_mpeg4(bytes)); }}};
  for (const auto& row : kinds) {
    if (!path.ends_with(row.extension)) continue;
    std::ifstream file(path, std::ios::binary);
    const std::string bytes((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
    ImageClip clip = row.cut(bytes);
    if (!clip.pictures().empty()) return std::make_shared<const ImageClip>(std::move(clip));
  }
  return nullptr;
}

bool is_key_picture(Codec kind, std::string_view picture) {
  constexpr std::size_t kUnitCode = 3;  // after 00 00 01
  constexpr unsigned kSequence = 0xb0;
  constexpr unsigned kGroup = 0xb3;
  switch (kind) {
    case Codec::kH264: {
      const Clip clip = Clip::from_annex_b(picture);
      return !clip.access_units().empty() && clip.access_units().front().key;
    }
    case Codec::kMpeg4:
      return byte_at(picture, kUnitCode) == kSequence || byte_at(picture, kUnitCode) == kGroup;
    case Codec::kJpeg:
      break;
  }
  return true;
}

std::vector<std::string> cut_jpeg(std::string_view bytes) {
  constexpr std::string_view kStart = "\xff\xd8";
  constexpr std::string_view kEnd = "\xff\xd9";
  std::vector<std::string> pictures;
  for (std::size_t begin = bytes.find(kStart); begin != std::string_view::npos;) {
    const std::optional<std::size_t> scan = scan_of(bytes, begin);
    const std::size_t end = scan ? bytes.find(kEnd, *scan) : std::string_view::npos;
    if (end == std::string_view::npos) break;
    pictures.emplace_back(bytes.substr(begin, end + kMarkerSize - begin));
    begin = bytes.find(kStart, end + kMarkerSize);
  }
  return pictures;
}

std::vector<std::string> cut_mpeg4(std::string_view bytes) {
  constexpr std::string_view kStartCode("\0\0\1", 3);
  constexpr unsigned kCodedPicture = 0xb6;
  std::vector<std::string> pictures;
  std::size_t begin = bytes.find(kStartCode);
  for (std::size_t unit = begin; unit != std::string_view::npos;) {
    const bool coded = byte_at(bytes, unit + kStartCode.size()) == kCodedPicture;
    unit = bytes.find(kStartCode, unit + kStartCode.size());
    if (!coded) continue;
    pictures.emplace_back(bytes.substr(begin, unit - begin));
    begin = unit;
  }
  return pictures;
}

std::string sei_unit(std::string_view text) {
  constexpr std::size_t kUuidSize = 16;
  constexpr std::size_t kLargestSizeByte = 255;
  std::string unit("\0\0\0\1\6\5", 6);  // an SEI unit that holds unregistered user data
  std::size_t size = kUuidSize + text.size();
  for (; size >= kLargestSizeByte; size -= kLargestSizeByte) unit += '\xff';
  unit += static_cast<char>(size);
  unit.append(kUuidSize, 'u').append(text);
  return unit + '\x80';
}

std::string with_user_data(Codec kind, const std::string& picture, std::string_view text) {
  if (text.empty()) return picture;
  std::string changed = picture;
  switch (kind) {
    case Codec::kJpeg:
      return changed.insert(kMarkerSize, "\xff\xfe" + two_bytes(text.size() + kMarkerSize).append(text));
    case Codec::kH264:
      return sei_unit(text) + picture;
    case Codec::kMpeg4:
      return changed.insert(picture.find(std::string("\0\0\1\xb6", 4)), std::string("\0\0\1\xb2", 4).append(text));
  }
  return changed;
}

}  // namespace vexa::camera
