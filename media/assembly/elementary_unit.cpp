// SPDX-License-Identifier: Apache-2.0
#include "media/assembly/elementary_unit.h"

#include <algorithm>

#include "media/assembly/start_code.h"

namespace vexa {
namespace {

UnitKind h264_kind(std::uint8_t code) {
  switch (code & 0x1f) {
    case 1:
    case 5:
      return UnitKind::kPicture;
    case 6:
      return UnitKind::kUserData;
    case 7:
      return UnitKind::kKeyHeader;
    default:
      return UnitKind::kOther;
  }
}

UnitKind mpeg4_kind(std::uint8_t code) {
  switch (code) {
    case 0xb0:
      return UnitKind::kKeyHeader;
    case 0xb2:
      return UnitKind::kUserData;
    case 0xb6:
      return UnitKind::kPicture;
    default:
      return UnitKind::kOther;
  }
}

constexpr std::string_view kPositionKey = "CamPos: ";
constexpr std::size_t kPositionLength = 24;
constexpr std::size_t kSearchedUserData = 256;

}  // namespace

UnitKind ElementaryCodec::kind_of(Bytes unit) const {
  // Safe: what stands before a stream's first start code can be shorter than one.
  if (unit.size() <= start_code.length) return UnitKind::kOther;
  return kind_of_code(unit[start_code.length]);
}

Bytes ElementaryCodec::text_of(Bytes unit) const { return unit.subspan(std::min(text_offset, unit.size())); }

const ElementaryCodec kH264Elementary = {{find_start_code_h264, kStartCodeLengthH264}, h264_kind, kSeiTextOffset};

const ElementaryCodec kMpeg4Elementary = {
    {find_start_code_mpeg4, kStartCodeLengthMpeg4}, mpeg4_kind, kMpeg4UserDataTextOffset};

std::optional<std::string_view> camera_position(Bytes data) {
  const std::string_view text(reinterpret_cast<const char*>(data.data()), data.size());
  const std::size_t place = text.find(kPositionKey);
  if (place == std::string_view::npos) return std::nullopt;
  return text.substr(place, kPositionLength);
}

Bytes front_of_user_data(Bytes data) { return data.first(std::min(data.size(), kSearchedUserData)); }

}  // namespace vexa
