// The text in a picture's user data that holds the camera's position.
#pragma once

#include <optional>
#include <string_view>

#include "runtime/base/bytes.h"

namespace vexa {

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
