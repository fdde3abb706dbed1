// SPDX-License-Identifier: Apache-2.0
// Elementary streams over HTTP: the part that each unit between two start codes plays in a picture.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>

#include "runtime/base/bytes.h"
#include "transport/wire/stream_window.h"

namespace vexa {

enum class UnitKind {
  kKeyHeader,  ///< what key pictures begin with
  kUserData,   ///< may hold the camera's position; not a part of the picture
  kPicture,    ///< ends the picture
  kOther       ///< part of the picture, and so is a unit cut short
};

/// What a reader has to know about a codec.
struct ElementaryCodec {
  StartCode start_code;
  UnitKind (*kind_of_code)(std::uint8_t code);  ///< by the byte after the start code
  std::size_t text_offset;                      ///< of user data, from the start code

  UnitKind kind_of(Bytes unit) const;
  /// The part of a user-data unit that is text.
  Bytes text_of(Bytes unit) const;
};

extern const ElementaryCodec kH264Elementary;
extern const ElementaryCodec kMpeg4Elementary;

/// Where the text of user data begins, counted from the unit's start code: after a SEI unit's types and sizes and the
/// start code of an MPEG-4 user-data unit.
constexpr std::size_t kSeiTextOffset = 11;
constexpr std::size_t kMpeg4UserDataTextOffset = 4;

/// The 24 characters from the first "CamPos: " on, fewer at the data's end; zeros before it end nothing. The text lies
/// in `data`.
std::optional<std::string_view> camera_position(Bytes data);

/// The part of user data that is searched: the first 256 bytes.
Bytes front_of_user_data(Bytes data);

}  // namespace vexa
