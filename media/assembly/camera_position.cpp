#include "media/assembly/camera_position.h"

#include <algorithm>

namespace vexa {
namespace {

constexpr std::string_view kPositionKey = "CamPos: ";
constexpr std::size_t kPositionLength = 24;
constexpr std::size_t kSearchedUserData = 256;

}  // namespace

std::optional<std::string_view> camera_position(Bytes data) {
  const std::string_view text(reinterpret_cast<const char*>(data.data()), data.size());
  const std::size_t place = text.find(kPositionKey);
  if (place == std::string_view::npos) return std::nullopt;
  return text.substr(place, kPositionLength);
}

Bytes front_of_user_data(Bytes data) { return data.first(std::min(data.size(), kSearchedUserData)); }

}  // namespace vexa
